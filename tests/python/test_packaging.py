"""The package a user installs with pip: the wheel built offline from pyproject.toml
installs into a fresh virtual environment, converts, shows its metadata and
uninstalls without a trace."""
import os
import pathlib
import subprocess
import sys

import pytest

import Dexmor

SOURCE = pathlib.Path(os.environ.get("DEXMOR_SOURCE_DIR", pathlib.Path(__file__).parents[2]))
SAMPLE = SOURCE / "examples" / "sample.zelmat"


def run(*args, **kwargs):
    result = subprocess.run([str(a) for a in args], capture_output=True, text=True, timeout=900, **kwargs)
    assert result.returncode == 0, result.stdout + result.stderr
    return result.stdout


def test_the_wheel_installs_converts_and_uninstalls(tmp_path):
    pytest.importorskip("build")
    # The module under test is taken from the build that made it, not compiled again.
    env = dict(os.environ, DEXMOR_CMAKE_BUILD_DIR=str(pathlib.Path(Dexmor.__file__).resolve().parents[1]),
               DEXMOR_WHEEL_WORK_DIR=str(tmp_path / "work"))
    run(sys.executable, "-m", "build", "--wheel", "--no-isolation", "--outdir", tmp_path / "dist", SOURCE, env=env)
    wheel, = (tmp_path / "dist").glob("Dexmor-*.whl")
    assert wheel.name.startswith(f"Dexmor-{Dexmor.__version__}-")

    run(sys.executable, "-m", "venv", tmp_path / "venv")
    python = tmp_path / "venv" / "bin" / "python"
    clean = {k: v for k, v in os.environ.items() if k != "PYTHONPATH"}
    run(python, "-m", "pip", "install", "--no-index", "--quiet", wheel, env=clean)
    converted = run(python, "-c", "import sys, Dexmor; sys.stdout.write(Dexmor.getZelmatXml(sys.argv[1]))", SAMPLE,
                    env=clean)
    assert converted == Dexmor.getZelmatXml(str(SAMPLE))
    shown = run(python, "-m", "pip", "show", "--files", "Dexmor", env=clean)
    assert f"Version: {Dexmor.__version__}" in shown and "License: MIT" in shown
    assert "Dexmor-stubs/__init__.pyi" in shown

    run(python, "-m", "pip", "uninstall", "--yes", "--quiet", "Dexmor", env=clean)
    gone = subprocess.run([python, "-c", "import Dexmor"], capture_output=True, text=True, env=clean)
    assert "No module named 'Dexmor'" in gone.stderr
    assert not list((tmp_path / "venv").rglob("Dexmor*"))
