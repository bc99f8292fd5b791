"""The type stub Dexmor.pyi describes exactly the module's public names, each
with its documentation; the copies beside the built module and as the stub
package Dexmor-stubs are current; and type checkers find and apply it."""
import ast
import os
import pathlib
import subprocess
import sys

import pytest

import Dexmor

SOURCE = pathlib.Path(os.environ.get("DEXMOR_SOURCE_DIR", pathlib.Path(__file__).parents[2]))
STUB = SOURCE / "module" / "Dexmor.pyi"


def stub_definitions():
    tree = ast.parse(STUB.read_text(encoding="utf-8"), filename=str(STUB))
    return tree, {node.name: node for node in tree.body
                  if isinstance(node, (ast.FunctionDef, ast.ClassDef)) and not node.name.startswith("_")}


def test_stub_names_are_the_module_names():
    _, definitions = stub_definitions()
    public = {name for name in dir(Dexmor) if not name.startswith("_")}
    assert set(definitions) == public


def test_stub_documents_everything_and_types_match():
    tree, definitions = stub_definitions()
    assert ast.get_docstring(tree)
    for name, node in definitions.items():
        assert ast.get_docstring(node), f"{name} has no docstring in the stub"
        assert isinstance(node, ast.ClassDef) == isinstance(getattr(Dexmor, name), type), name


def test_copy_beside_the_module_is_current():
    beside = pathlib.Path(Dexmor.__file__).with_name("Dexmor.pyi")
    assert beside.read_bytes() == STUB.read_bytes()
    assert (beside.parent / "Dexmor-stubs" / "__init__.pyi").read_bytes() == STUB.read_bytes()


# A program using every call as a typed caller would; mypy --strict must accept
# it, and must reject the misuse below it.
TYPED_PROGRAM = """
import os
import pathlib
from typing import Optional, Tuple

import Dexmor

path = pathlib.Path("lib.zelmat")
a: str = Dexmor.getZelmatXml(path)
b: str = Dexmor.getZeloptXml("scene.zelopt")
c: Optional[str] = Dexmor.diagnose(os.fspath(path))
d: str = Dexmor.convert(path, kind="zelmat", strict=True, max_output=0)
with open("lib.xml", "wb") as sink:
    nothing: None = Dexmor.convert(path, out=sink)
Dexmor.convert(path, out=pathlib.Path("lib.xml"), strict=True)
e: Tuple[str, Optional[str]] = Dexmor.convertWithDiagnosis("lib.zelmat", max_output=None)
f: str = Dexmor.convertBytes(b"...", "zelopt", strict=False)
g: Tuple[str, Optional[str]] = Dexmor.convertBytesWithDiagnosis(bytearray(b"..."), "zelmat")
h: Optional[str] = Dexmor.diagnoseBytes(memoryview(b"..."), "zelmat")
version: str = Dexmor.__version__
try:
    Dexmor.convert(path, strict=True)
except Dexmor.ReadError as failure:
    where: Optional[str] = failure.path
    offset: int = failure.offset
    records: list[str] = failure.record_path
    reason: str = failure.reason
except Dexmor.error:
    pass
"""


def run_mypy(tmp_path, program):
    source = tmp_path / "typed.py"
    source.write_text(program, encoding="utf-8")
    return subprocess.run([sys.executable, "-m", "mypy", "--strict", "--no-incremental", "--cache-dir", os.devnull,
                           str(source)], capture_output=True, text=True, timeout=300, cwd=tmp_path)


def test_mypy_finds_the_stub_package_and_checks_callers(tmp_path):
    pytest.importorskip("mypy")
    run = run_mypy(tmp_path, TYPED_PROGRAM)
    assert run.returncode == 0, run.stdout + run.stderr
    run = run_mypy(tmp_path, "import Dexmor\nx: int = Dexmor.convertBytes('lib', 'zelmat')\n"
                             "y: str = Dexmor.convert(b'lib.zelmat')\nz: str = Dexmor.convert('lib.zelmat', out='x.xml')\n")
    assert run.returncode == 1
    assert "incompatible type" in run.stdout and "Incompatible types in assignment" in run.stdout
    assert "typed.py:3: error: No overload variant" in run.stdout  # a bytes path
    assert "typed.py:4: error: Incompatible types in assignment" in run.stdout  # out= returns None


def test_stubtest_finds_the_stub_true_to_the_module():
    pytest.importorskip("mypy")
    run = subprocess.run([sys.executable, "-m", "mypy.stubtest", "Dexmor"], capture_output=True, text=True,
                         timeout=300)
    assert run.returncode == 0, run.stdout + run.stderr
