"""Dexmor.convert and its siblings: the getters' text for what reads, and an
exception, never a quiet "", for what does not."""
import inspect
import os
import pathlib
import pickle

import pytest

import Dexmor

EXAMPLES = pathlib.Path(os.environ["DEXMOR_SOURCE_DIR"]) / "examples"
LIBRARY = EXAMPLES / "sample.zelmat"
OPTIONS = EXAMPLES / "sample.zelopt"
BUDGET = "the XML would exceed {} bytes (the output budget; max_output to change it)"


@pytest.fixture
def files(tmp_path):
    """A truncated library, one whose first material has an unknown kind, and a text file."""
    data = LIBRARY.read_bytes()
    truncated = tmp_path / "truncated.zelmat"
    truncated.write_bytes(data[:5000])
    damaged = tmp_path / "damaged.zelmat"
    damaged.write_bytes(data[:12] + (41).to_bytes(4, "little") + data[16:])
    text = tmp_path / "notes.zelopt"
    text.write_text("<Assets>été</Assets>", encoding="utf-8")
    return {"truncated": truncated, "damaged": damaged, "text": text}


@pytest.mark.parametrize("sample, getter", [(LIBRARY, Dexmor.getZelmatXml), (OPTIONS, Dexmor.getZeloptXml)])
def test_samples_give_the_getters_text_by_path_and_by_bytes(sample, getter):
    expected = getter(str(sample))
    kind = sample.suffix[1:]
    data = sample.read_bytes()
    assert Dexmor.convert(sample) == Dexmor.convert(str(sample), kind=kind, strict=True) == expected
    assert Dexmor.convertWithDiagnosis(sample) == (expected, None)
    for buffer in (data, bytearray(data), memoryview(data), memoryview(b"xx" + data)[2:]):
        assert Dexmor.convertBytes(buffer, kind, strict=True) == expected
    assert Dexmor.convertBytesWithDiagnosis(data, kind=kind) == (expected, None)
    assert Dexmor.diagnoseBytes(data, kind) is None


def test_files_that_do_not_read_pass_through_with_their_reason(files):
    for path in files.values():
        text = Dexmor.getZelmatXml(path) if path.suffix == ".zelmat" else Dexmor.getZeloptXml(path)
        reason = Dexmor.diagnose(path)
        assert reason is not None
        assert Dexmor.convert(path) == text
        assert Dexmor.convertWithDiagnosis(path) == (text, reason)
        kind = path.suffix[1:]
        assert Dexmor.convertBytesWithDiagnosis(path.read_bytes(), kind) == (text, reason)
        assert Dexmor.diagnoseBytes(bytearray(path.read_bytes()), kind) == reason


def test_strict_raises_read_error_with_the_failure(files):
    assert issubclass(Dexmor.ReadError, Dexmor.error)
    cases = [("truncated", ["archive image"]), ("damaged", ["material 0"]), ("text", [])]
    for name, record_path in cases:
        path = files[name]
        with pytest.raises(Dexmor.ReadError) as raised:
            Dexmor.convert(path, strict=True)
        error = raised.value
        assert (error.path, error.record_path, type(error.offset)) == (str(path), record_path, int)
        where = "".join(f"{record} / " for record in record_path)[:-3]
        assert f"{where}{': ' if where else ''}{error.reason} at offset {error.offset}" == Dexmor.diagnose(path)
        assert str(error) == f"{path}: not readable as binary: {Dexmor.diagnose(path)}"
        # Dask and multiprocessing send exceptions between processes.
        copy = pickle.loads(pickle.dumps(error))
        assert (type(copy), copy.path, copy.reason, copy.offset, copy.record_path) == (
            Dexmor.ReadError, error.path, error.reason, error.offset, error.record_path)

    with pytest.raises(Dexmor.ReadError) as raised:
        Dexmor.convertBytes(files["damaged"].read_bytes(), "zelmat", strict=True)
    assert (raised.value.path, raised.value.reason, raised.value.offset) == (None, "unknown material kind 41", 16)
    assert str(raised.value) == "not readable as binary: material 0: unknown material kind 41 at offset 16"


@pytest.mark.parametrize("strict", [False, True])
def test_unopenable_paths_raise_what_open_raises(tmp_path, strict):
    (tmp_path / "folder.zelmat").mkdir()
    for path in (tmp_path / "missing.zelmat", tmp_path / "folder.zelmat"):
        with pytest.raises(OSError) as opened:
            open(path, "rb")
        for call in (lambda p: Dexmor.convert(p, strict=strict), Dexmor.convertWithDiagnosis):
            with pytest.raises(OSError) as raised:
                call(path)
            assert type(raised.value) is type(opened.value)
            assert (raised.value.errno, raised.value.filename, str(raised.value)) == (
                opened.value.errno, str(path), str(opened.value))


def test_kind_overrides_the_extension(tmp_path):
    backup = tmp_path / "lib.zelmat.bak"
    backup.write_bytes(LIBRARY.read_bytes())
    assert Dexmor.convert(backup, kind="zelmat") == Dexmor.getZelmatXml(LIBRARY)
    with pytest.raises(Dexmor.error, match=r"lib\.zelmat\.bak"):
        Dexmor.convert(backup)
    with pytest.raises(Dexmor.ReadError):
        Dexmor.convert(LIBRARY, kind="zelopt", strict=True)
    for bad, exception in [("ZELMAT", ValueError), ("xml", ValueError), (3, TypeError)]:
        with pytest.raises(exception, match="kind"):
            Dexmor.convert(LIBRARY, kind=bad)
        with pytest.raises(exception, match="kind"):
            Dexmor.convertBytes(b"", bad)


def test_max_output_is_the_budget(tmp_path):
    size = len(Dexmor.getZelmatXml(LIBRARY).encode("utf-8"))
    assert len(Dexmor.convert(LIBRARY, max_output=size)) > 0
    assert Dexmor.convert(LIBRARY, max_output=0) == Dexmor.convert(LIBRARY)
    with pytest.raises(Dexmor.error) as raised:
        Dexmor.convert(str(LIBRARY), max_output=size - 1)
    assert str(raised.value) == f"{LIBRARY}: " + BUDGET.format(size - 1)
    with pytest.raises(Dexmor.error) as raised:
        Dexmor.convertBytes(LIBRARY.read_bytes(), "zelmat", max_output=1000)
    assert str(raised.value) == BUDGET.format(1000)
    # The pass-through text is held to the budget too.
    text = tmp_path / "big.zelopt"
    text.write_text("x" * 5000)
    with pytest.raises(Dexmor.error, match="4999 bytes"):
        Dexmor.convertWithDiagnosis(text, max_output=4999)
    for bad, exception in [(-1, ValueError), ("10", TypeError), (1.5, TypeError), (1 << 64, OverflowError)]:
        with pytest.raises(exception):
            Dexmor.convert(LIBRARY, max_output=bad)


def test_arguments_are_refused_as_open_refuses_them(tmp_path):
    with pytest.raises(TypeError):
        Dexmor.convert(os.fsencode(LIBRARY))
    with pytest.raises(ValueError, match="embedded null character"):
        Dexmor.convert(f"{LIBRARY}\0.zelmat")
    for data in ("text", 7, memoryview(b"abcd")[::2]):
        with pytest.raises((TypeError, BufferError)):
            Dexmor.convertBytes(data, "zelmat")
    # A call refused after taking the buffer lets go of it: the bytearray can grow again.
    data = bytearray(b"<Assets/>")
    for refused in (lambda: Dexmor.convertBytes(data, "zelmat", unknown=1), lambda: Dexmor.diagnoseBytes(data, "x")):
        with pytest.raises((TypeError, ValueError)):
            refused()
        data += b" "


def test_signatures_and_documentation():
    assert str(inspect.signature(Dexmor.convert)) == \
        "(path, /, *, kind=None, strict=False, max_output=None, out=None, wrap=False)"
    assert str(inspect.signature(Dexmor.convertBytes)) == "(data, /, kind, *, strict=False, max_output=None, wrap=False)"
    for name in ("diagnose", "convertWithDiagnosis", "convertBytesWithDiagnosis", "diagnoseBytes"):
        function = getattr(Dexmor, name)
        assert inspect.signature(function).parameters and function.__doc__.strip(), name
    assert Dexmor.ReadError.__doc__
