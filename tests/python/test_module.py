"""The Python surface of Dexmor: arguments, errors, and the text that comes back
for files that do not read as binary (they are passed through as text)."""
import os
import pathlib
import subprocess
import sys
import threading

import pytest

import Dexmor

CALLS = [Dexmor.getZelmatXml, Dexmor.getZeloptXml]


def extension(call):
    return "zelmat" if call is Dexmor.getZelmatXml else "zelopt"


def make(directory, name, data=b"<Assets/>"):
    path = directory / name
    path.write_bytes(data)
    return path


class PathLike:
    def __init__(self, value):
        self.value = value

    def __fspath__(self):
        return self.value


def test_module_surface():
    assert Dexmor.__doc__ is None
    assert Dexmor.getZelmatXml.__doc__ == "Gets the xml from a zelmat file."
    assert Dexmor.getZeloptXml.__doc__ == "Gets the xml from a zelopt file."
    assert issubclass(Dexmor.error, Exception)
    assert f"{Dexmor.error.__module__}.{Dexmor.error.__qualname__}" == "Dexmor.error"


# ---- arguments -------------------------------------------------------------


@pytest.mark.parametrize("wrap", [str, pathlib.Path, lambda p: PathLike(str(p))], ids=["str", "Path", "PathLike"])
def test_accepts_str_and_pathlike(tmp_path, wrap):
    path = make(tmp_path, "lib.zelmat", b"<Assets>x</Assets>")
    assert Dexmor.getZelmatXml(wrap(path)) == "<Assets>x</Assets>"


@pytest.mark.parametrize("call", CALLS)
@pytest.mark.parametrize(
    "args",
    [(b"lib.zelmat",), (bytearray(b"lib.zelmat"),), (PathLike(b"lib.zelmat"),), (PathLike(7),), (7,), (None,), (),
     ("a.zelmat", "b.zelmat")],
    ids=["bytes", "bytearray", "PathLike-bytes", "PathLike-int", "int", "None", "no-argument", "two-arguments"],
)
def test_rejects_other_arguments(call, args):
    with pytest.raises(TypeError):
        call(*args)


@pytest.mark.parametrize("call", CALLS)
def test_nul_in_path_is_refused_not_cut(call, tmp_path):
    # Cut at the NUL, the path would name this existing file.
    prefix = make(tmp_path, "lib." + extension(call))
    with pytest.raises(ValueError, match="embedded null character"):
        call(f"{prefix}\0.{extension(call)}")


# ---- extension test --------------------------------------------------------


@pytest.mark.parametrize(
    "call, name",
    [(Dexmor.getZelmatXml, "lib.ZelMat"), (Dexmor.getZelmatXml, "v2.lib.ZELMAT"), (Dexmor.getZeloptXml, "o.zelOPT")],
)
def test_extension_ignores_ascii_case(tmp_path, call, name):
    assert call(str(make(tmp_path, name))) == "<Assets/>"


@pytest.mark.parametrize(
    "call, name",
    [(Dexmor.getZelmatXml, "lib.zelmat.bak"), (Dexmor.getZelmatXml, "lib.zelmat."), (Dexmor.getZelmatXml, "zelmat"),
     (Dexmor.getZelmatXml, "lib.zelopt"), (Dexmor.getZeloptXml, "o.zelmat"), (Dexmor.getZelmatXml, "lib.zelmät"),
     (Dexmor.getZelmatXml, "x.zelmat/f")],
)
def test_extension_refused(tmp_path, call, name):
    (tmp_path / "x.zelmat").mkdir()  # the only dot of "x.zelmat/f" is in a directory name
    path = str(make(tmp_path, name))
    with pytest.raises(Dexmor.error) as raised:
        call(path)
    assert repr(path) in str(raised.value) and f".{extension(call)}" in str(raised.value)


# ---- pass-through of text files ------------------------------------------------


@pytest.mark.parametrize(
    "data, text",
    [
        (b'<?xml version="1.0"?>\n<Assets>\r\n <Asset url="/a&amp;b"/>\n</Assets>\n',
         '<?xml version="1.0"?>\n<Assets>\r\n <Asset url="/a&amp;b"/>\n</Assets>\n'),
        ("<Assets name='Grüße 東京 🎨'/>".encode("utf-8"), "<Assets name='Grüße 東京 🎨'/>"),
        (b"<Assets name='caf\xe9 \x80 \x81 \x9f'/>", "<Assets name='café € \x81 Ÿ'/>"),
        # Not valid UTF-8 as a whole (here a surrogate): the whole file is Windows-1252.
        ("é".encode("utf-8") + b"\xed\xa0\x80", "Ã©í\xa0€"),
        (b"", ""),
        (b"<Assets/>\0hidden", "<Assets/>"),
    ],
    ids=["xml", "utf8", "cp1252", "utf8-surrogate", "empty", "nul-cut"],
)
@pytest.mark.parametrize("call", CALLS)
def test_text_file_passes_through(tmp_path, call, data, text):
    result = call(str(make(tmp_path, "f." + extension(call), data)))
    assert type(result) is str and result == text


@pytest.mark.parametrize("wide", ["", "é", "€", "🎨"], ids=["ascii", "latin1", "bmp", "astral"])
def test_large_text_of_every_character_width(tmp_path, wide):
    # Megabytes of text are made into a str another way than short ones.
    text = ("<Assets name='x'/>\n" * 5 + wide + "ab" * 3 + wide) * 40_000
    assert Dexmor.getZelmatXml(str(make(tmp_path, "big.zelmat", text.encode("utf-8")))) == text


@pytest.mark.parametrize("call", CALLS)
def test_unopenable_paths_give_empty_text(tmp_path, call):
    assert call(str(tmp_path / f"missing.{extension(call)}")) == ""
    (tmp_path / f"folder.{extension(call)}").mkdir()
    assert call(str(tmp_path / f"folder.{extension(call)}")) == ""


def test_fifo_gives_empty_text_without_blocking(tmp_path):
    os.mkfifo(tmp_path / "pipe.zelmat")
    # In a child process, so that a call that blocks fails the test instead of hanging it.
    child = subprocess.run(
        [sys.executable, "-c", "import sys, Dexmor; print(repr(Dexmor.getZelmatXml(sys.argv[1])))",
         str(tmp_path / "pipe.zelmat")], capture_output=True, text=True, timeout=30)
    assert (child.returncode, child.stdout) == (0, "''\n"), child.stderr


def test_name_that_is_not_utf8_still_opens(tmp_path):
    raw = os.fsencode(str(tmp_path)) + b"/\xff\xfe lib.zelmat"
    with open(raw, "wb") as file:
        file.write(b"<Assets/>")
    assert Dexmor.getZelmatXml(os.fsdecode(raw)) == "<Assets/>"


def test_concurrent_calls_each_get_their_own_text(tmp_path):
    texts = [f"<Assets n='{i}'>" + "é" * 50000 + "</Assets>" for i in range(6)]
    paths = [str(make(tmp_path, f"f{i}.zelmat", t.encode("utf-8"))) for i, t in enumerate(texts)]
    results = [[] for _ in paths]
    threads = [threading.Thread(target=lambda i=i: results[i].extend(Dexmor.getZelmatXml(paths[i]) for _ in range(5)))
               for i in range(len(paths))]
    for thread in threads:
        thread.start()
    for thread in threads:
        thread.join(timeout=60)
    assert results == [[t] * 5 for t in texts]
