"""Finding out why a file did not read as binary: Dexmor.diagnose and dexmor check."""
import os
import pathlib
import shutil
import subprocess

import pytest

import Dexmor

CLI = os.path.abspath(os.environ["DEXMOR_CLI"]) if "DEXMOR_CLI" in os.environ else "dexmor"
EXAMPLES = pathlib.Path(os.environ["DEXMOR_SOURCE_DIR"]) / "examples"


@pytest.fixture
def files(tmp_path):
    """Good samples, a damaged library, a text file and a missing file."""
    library = shutil.copy(EXAMPLES / "sample.zelmat", tmp_path / "good.zelmat")
    options = shutil.copy(EXAMPLES / "sample.zelopt", tmp_path / "good.ZELOPT")
    damaged = tmp_path / "damaged.zelmat"
    data = bytearray((EXAMPLES / "sample.zelmat").read_bytes())
    data[12:16] = (41).to_bytes(4, "little")  # the first material's kind id
    damaged.write_bytes(bytes(data))
    text = tmp_path / "text.zelopt"
    text.write_text("<Assets/>")
    return {"library": library, "options": options, "damaged": damaged, "text": text,
            "missing": tmp_path / "missing.zelmat"}


def test_diagnose_gives_none_or_the_reason(files):
    assert Dexmor.diagnose(files["library"]) is None
    assert Dexmor.diagnose(str(files["options"])) is None
    assert Dexmor.diagnose(files["damaged"]) == "material 0: unknown material kind 41 at offset 16"
    assert Dexmor.diagnose(files["text"]).startswith("unknown options version")
    assert Dexmor.diagnose(files["missing"]) == "the file cannot be opened: No such file or directory"
    with pytest.raises(Dexmor.error, match=r"\.zelmat.*\.zelopt"):
        Dexmor.diagnose(files["library"].with_suffix(".txt"))
    with pytest.raises(TypeError):
        Dexmor.diagnose(b"x.zelmat")


def test_check_prints_one_line_per_file(files):
    names = ["library", "options", "damaged", "text", "missing"]
    run = subprocess.run([CLI, "check", *(str(files[n]) for n in names)], capture_output=True, timeout=60)
    assert (run.returncode, run.stderr) == (1, b"")
    lines = run.stdout.decode().splitlines()
    # The sample truly has one lint finding: a material with two layers of one name.
    twice = 'material 1 "Brushed Steel 2": the url "/Brushed Steel 2/BRDFReflection{}" is given to 2 assets'
    assert lines == [
        f"{files['library']}: material library, generation 3, 20 materials",
        f"{files['library']}: warning: " + twice.format(""),
        f"{files['library']}: warning: " + twice.format("/transparency_texture"),
        f"{files['options']}: render options, version 23",
        f"{files['damaged']}: not readable as binary: material 0: unknown material kind 41 at offset 16;"
        " the conversion returns the empty text",
        f"{files['text']}: not readable as binary: {Dexmor.diagnose(files['text'])};"
        " the conversion returns the file's text (9 bytes)",
        f"{files['missing']}: not readable as binary: the file cannot be opened: No such file or directory;"
        " the conversion returns the empty text",
    ]


@pytest.mark.parametrize("args, status", [(["library", "options"], 0), (["library", "text"], 1),
                                          (["library", "unknown"], 2), ([], 2)])
def test_check_exit_status(files, args, status):
    files["unknown"] = files["library"].with_suffix(".txt")
    run = subprocess.run([CLI, "check", *(str(files[a]) for a in args)], capture_output=True, timeout=60)
    assert run.returncode == status
