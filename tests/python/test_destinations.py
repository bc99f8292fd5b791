"""Where a conversion's document goes: a str of the width its characters need,
built piece by piece; a path that is replaced only by a whole document; a binary
file object that is handed every byte."""
import io
import os
import pathlib
import subprocess

import pytest

import Dexmor

CLI = os.path.abspath(os.environ["DEXMOR_CLI"]) if "DEXMOR_CLI" in os.environ else "dexmor"
MAKE_SEEDS = os.environ.get("DEXMOR_MAKE_SEEDS")
LIBRARY = pathlib.Path(os.environ["DEXMOR_SOURCE_DIR"]) / "examples" / "sample.zelmat"


def library_of_names(path, *names):
    if not MAKE_SEEDS:
        pytest.skip("needs make_seeds (DEXMOR_MAKE_SEEDS)")
    subprocess.run([MAKE_SEEDS, "--names", str(path), *names], check=True)
    return path


def tool_text(path):
    return subprocess.run([CLI, "xml", str(path)], capture_output=True, check=True).stdout.decode("utf-8")


@pytest.mark.parametrize("names", [
    # Pieces of 64 KiB cut through characters of two, three and four bytes;
    # the str is made wider twice in mid-document, after more than a piece.
    ["plain " * 4000, "é" * 3000, "Ω" * 3000, "\U0001F600" * 3000],
    ["\U0001F600" * 5000, "plain"],  # the widest first
    ["Latin-1 only: \u00e9\u00c4\u00ff" * 500],
    ["plain"],
])
def test_the_str_holds_the_document_at_the_width_of_its_characters(tmp_path, names):
    path = library_of_names(tmp_path / "names.zelmat", *names)
    expected = tool_text(path)
    text = Dexmor.convert(path)
    # A str of a wider representation than its characters need compares unequal.
    assert text == expected
    assert text.encode("utf-8") == expected.encode("utf-8")
    assert Dexmor.getZelmatXml(str(path)) == expected


def test_a_document_taken_back_gives_a_narrow_text(tmp_path):
    # Wide names, then a cut: the library does not read, and its text is "".
    path = library_of_names(tmp_path / "names.zelmat", "\U0001F600" * 30000, "plain")
    truncated = tmp_path / "truncated.zelmat"
    truncated.write_bytes(path.read_bytes()[:-100])
    assert Dexmor.convert(truncated) == "" and Dexmor.convert(truncated).isascii()
    assert Dexmor.convertWithDiagnosis(truncated)[1] is not None


def test_out_writes_the_document_to_a_path(tmp_path):
    target = tmp_path / "sample.xml"
    assert Dexmor.convert(LIBRARY, out=target) is None
    assert target.read_bytes() == Dexmor.convert(LIBRARY).encode("utf-8")
    assert Dexmor.convert(str(LIBRARY), out=str(target), max_output=0) is None
    assert os.listdir(tmp_path) == ["sample.xml"]


def test_out_leaves_the_target_as_it_was_on_any_failure(tmp_path):
    target = tmp_path / "kept.xml"
    target.write_text("earlier")
    text_file = tmp_path / "notes.zelmat"
    text_file.write_text("<Assets/>")
    with pytest.raises(Dexmor.error, match="the output budget"):
        Dexmor.convert(LIBRARY, out=target, max_output=1000)
    with pytest.raises(Dexmor.ReadError):
        Dexmor.convert(text_file, out=target, strict=True)
    with pytest.raises(FileNotFoundError):
        Dexmor.convert(tmp_path / "missing.zelmat", out=target)
    with pytest.raises(OSError, match="could not be written"):
        Dexmor.convert(LIBRARY, out=tmp_path / "no-such-folder" / "x.xml")
    with pytest.raises(TypeError):
        Dexmor.convert(LIBRARY, out=b"bytes.xml")
    assert target.read_text() == "earlier"
    assert sorted(os.listdir(tmp_path)) == ["kept.xml", "notes.zelmat"]
    # Without strict, a text file is written as its text, as convert() returns it.
    assert Dexmor.convert(text_file, out=target) is None
    assert target.read_text() == "<Assets/>"


class RawWriter(io.RawIOBase):
    """A raw file that takes at most 1,000 bytes a call, as raw files may."""

    def __init__(self):
        self.data = bytearray()

    def writable(self):
        return True

    def write(self, b):
        taken = bytes(b[:1000])
        self.data += taken
        return len(taken)


class FailingWriter(io.RawIOBase):
    def writable(self):
        return True

    def write(self, b):
        raise OSError(28, "No space left on device")


def test_out_hands_a_file_object_every_byte(tmp_path):
    expected = Dexmor.convert(LIBRARY).encode("utf-8")
    buffer = io.BytesIO()
    assert Dexmor.convert(LIBRARY, out=buffer) is None
    assert buffer.getvalue() == expected
    raw = RawWriter()
    Dexmor.convert(LIBRARY, out=raw)
    assert bytes(raw.data) == expected
    with open(tmp_path / "opened.xml", "wb") as opened:
        Dexmor.convert(LIBRARY, out=opened)
    assert (tmp_path / "opened.xml").read_bytes() == expected

    with pytest.raises(OSError, match="No space left") as raised:
        Dexmor.convert(LIBRARY, out=FailingWriter())
    assert raised.value.errno == 28
    # A library that does not read is read through first: nothing is written.
    truncated = tmp_path / "truncated.zelmat"
    truncated.write_bytes(LIBRARY.read_bytes()[:5000])
    buffer = io.BytesIO()
    with pytest.raises(Dexmor.ReadError):
        Dexmor.convert(truncated, out=buffer, strict=True)
    assert buffer.getvalue() == b""


def test_standard_output_into_a_file_withdraws_a_library_that_fails(tmp_path):
    # A regular file can be truncated back, so the tool reads each library once
    # and withdraws what it wrote of one that fails late (here past the first
    # quarter megabyte written); a pipe gets the same bytes.
    if not MAKE_SEEDS:
        pytest.skip("needs make_seeds (DEXMOR_MAKE_SEEDS)")
    big = tmp_path / "big.zelmat"
    subprocess.run([MAKE_SEEDS, "--amplifier", "3000", "400", str(big)], check=True)
    data = bytearray(big.read_bytes())
    at = len(data) * 6 // 10
    data[at:at + 48] = b"\xff" * 48  # one of the later layers
    failing = tmp_path / "failing.zelmat"
    failing.write_bytes(data)
    assert "BRDF layer 2" in Dexmor.diagnose(failing) and Dexmor.convert(failing) == ""
    assert len(Dexmor.convert(big)) > 1 << 20
    again = tmp_path / "again.zelmat"
    again.write_bytes(LIBRARY.read_bytes())
    expected = (Dexmor.convert(LIBRARY) * 2).encode("utf-8")
    arguments = [CLI, "xml", "-q", str(LIBRARY), str(failing), str(again)]
    with open(tmp_path / "out.xml", "wb") as out:
        assert subprocess.run(arguments, stdout=out).returncode == 0
    assert (tmp_path / "out.xml").read_bytes() == expected
    assert subprocess.run(arguments, capture_output=True).stdout == expected
