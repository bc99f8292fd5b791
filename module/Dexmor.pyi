"""Dexmor: material libraries (.zelmat) and render-options files (.zelopt) as XML.

Each call takes one stored file, by its path or as its bytes, and returns text.
A file that reads as a binary file of its kind gives its XML asset document. Any
other file is taken to be XML text already and comes back as it stands: its bytes
up to the first NUL byte, decoded as UTF-8, or as Windows-1252 when they are not
UTF-8. `diagnose` tells which of these a file is, and why.

Two generations of calls differ only where something goes wrong:

- `getZelmatXml` and `getZeloptXml` return "" for a file that cannot be opened
  or read in full (missing, unreadable, a directory, a FIFO), and take the kind
  from the extension only.
- `convert` (and `convertWithDiagnosis`, `convertBytes`,
  `convertBytesWithDiagnosis`) never let a failure look like a document: a file
  that cannot be opened raises the OSError that open() raises
  (FileNotFoundError, PermissionError, IsADirectoryError, or OSError with
  EINVAL for a FIFO or device), and with strict=True a file that does not read
  as binary raises `ReadError` instead of coming back as its text. The kind is
  the extension's unless kind= says.

A document may have at most the larger of 256 MiB and 1,000 times the file's
size (the output budget; a hostile file can ask for far more): beyond it the
call raises `error`. The newer calls take another budget as max_output= (0:
none). Ctrl-C interrupts a long call within a fraction of a second.

The calls release the interpreter lock while they convert, so threads run them
in parallel. A path is a `str` or an `os.PathLike` returning `str`; `bytes`
paths raise `TypeError`, a path holding a NUL character raises `ValueError`.
Data is any bytes-like object (bytes, bytearray, memoryview, a contiguous
buffer), converted in place without a copy; a bytearray cannot be resized while
it is converted, and one changed by another thread meanwhile gives no sensible
text.
"""

import os
from typing import Any, Dict, List, Literal, Optional, Protocol, Tuple, Union, overload

_Path = Union[str, "os.PathLike[str]"]
_Data = Union[bytes, bytearray, memoryview]
_Kind = Literal["zelmat", "zelopt"]

class _BinaryWriter(Protocol):
    def write(self, data: bytes, /) -> object: ...

__version__: str

class error(Exception):
    """Raised when a path's extension is not the one the call expects (".zelmat"
    or ".zelopt", in any letter case), when the document would exceed the output
    budget ("PATH: the XML would exceed N bytes (the output budget)", and from the
    newer calls "PATH: the XML would exceed N bytes (the output budget; max_output
    to change it)", without "PATH: " for bytes), or when a conversion fails for a
    reason that lies outside the file (running out of memory raises MemoryError).
    `ReadError` is a kind of it."""

class ReadError(error):
    """Raised by a strict conversion (strict=True) of a file that does not read as
    binary. Its message is "PATH: not readable as binary: " and the reason that
    `diagnose` gives."""

    path: Optional[str]
    """The path as given (after os.fspath); None for bytes."""
    reason: str
    """What was wrong, as "unknown material kind 41"."""
    offset: int
    """The offset in the file just after the wrong value."""
    record_path: List[str]
    """The records from the top of the file down to the one that failed, as
    ['material 4', 'BRDF layer 0', 'texture "color_tex"'] (fields named as the
    XML names them; a material or layer whose name was read shows it, quoted);
    empty when the file failed before its first record."""

def getZelmatXml(path: _Path, /) -> str:
    """Gets the xml from a zelmat file.

    Returns the XML document of the material library at `path`: one `<Assets>`
    element per material, each holding the assets of the material's tree
    (nested materials, BRDF layers, textures, UVW generators, bitmaps) before
    the material's own asset. A file that does not read as a material library
    comes back as its own text; a file that cannot be opened gives "".

    Raises `error` when `path` does not end in ".zelmat" (in any letter case)
    or the document would exceed the output budget.
    """

def getZeloptXml(path: _Path, /) -> str:
    """Gets the xml from a zelopt file.

    Returns the XML document of the render options at `path`: one `<Assets>`
    document with an `Assets` element for each settings section, the camera
    and the environment. A file that does not read as render options comes
    back as its own text; a file that cannot be opened gives "".

    Raises `error` when `path` does not end in ".zelopt" (in any letter case)
    or the document would exceed the output budget.
    """

def diagnose(path: _Path, /) -> Optional[str]:
    """Tells why a file would not convert to an XML document.

    Returns None when the file at `path` reads as a binary file of the kind
    its extension names (".zelmat" or ".zelopt", in any letter case), so that
    getZelmatXml or getZeloptXml returns its XML document. Otherwise returns
    the reason as one line: that the file cannot be opened, or where its
    records stopped reading (the path of records from the top of the file,
    what was wrong there and the offset in the file just after it), as in
    'material 4 / BRDF layer 0: unknown BRDF layer kind 41 at offset 1667'.
    The conversion of such a file returns its own text (or "").

    Raises `error` when `path` ends in neither extension.
    """

@overload
def convert(__path: _Path, *, kind: Optional[_Kind] = None, strict: bool = False,
            max_output: Optional[int] = None, out: None = None, wrap: bool = False) -> str:
    """Converts the file at `path` to its XML document.

    The file is read as `kind` ("zelmat" or "zelopt") when given, else as the kind
    its extension names (".zelmat" or ".zelopt", in any letter case). It gives the
    same text as getZelmatXml / getZeloptXml, except that nothing that goes wrong
    comes back as text:

    - a file that cannot be opened or read in full raises what open() raises
      (FileNotFoundError, PermissionError, IsADirectoryError; OSError for a FIFO
      or a device), with `path` as its filename;
    - with strict=True, a file that does not read as binary raises `ReadError`
      (without it, the file comes back as its own text).

    `max_output` is the output budget in bytes: None for the default (the larger
    of 256 MiB and 1,000 times the file's size), 0 for none. A document over it
    raises `error`. Raises `error` when `path` ends in neither extension and no
    kind is given, ValueError for another kind or a negative max_output.

    The str holds each character at the width its widest character needs, built
    in place as the document is made: the call holds the document once.

    With wrap=True the document comes in its wrapped form, which any XML tool
    reads: an XML declaration and one root, <AssetDocument kind="zelmat"> (or
    "zelopt"), around the <Assets> blocks, with U+FFFD for each character XML 1.0
    cannot carry; a file passed through as text gives its text, escaped, in a
    <passedThrough> element. The schema is share/dexmor/dexmor-assets.rng.
    """

@overload
def convert(__path: _Path, *, kind: Optional[_Kind] = None, strict: bool = False,
            max_output: Optional[int] = None, out: Union[_Path, _BinaryWriter], wrap: bool = False) -> None:
    """Converts the file at `path` and writes its XML document (UTF-8) to `out`
    instead of returning it, holding no more than a piece of it at a time.

    `out` is a path or a binary file object (anything with a write(bytes)
    method). A path is replaced only by a whole document: the file is written
    beside it and put in its place at the end, and on any failure (the file
    cannot be opened, strict=True refuses it, the budget is exceeded, a write
    fails) an earlier file there is left as it was, with nothing else left
    behind. A file object is handed the document piece by piece; a library is
    read through before its first byte is written, so nothing is written for one
    that does not read as binary, but a document over its budget raises after
    part of it was written. What write() raises is raised. Returns None;
    otherwise raises as convert() does.
    """

def convertWithDiagnosis(path: _Path, /, *, kind: Optional[_Kind] = None,
                         max_output: Optional[int] = None) -> Tuple[str, Optional[str]]:
    """Converts the file at `path` and tells whether it read as binary, reading
    the file once.

    Returns (text, reason): text as convert() returns it, and reason None when
    the file read as binary, else why it did not, as diagnose() gives it (text
    is then the file's own text). This pair is the whole answer a batch needs
    for a file: the document to store and, for a file passed through as text,
    the line to report; a class of its own would hold nothing more. Raises as
    convert() does.
    """

def convertBytes(data: _Data, /, kind: _Kind, *, strict: bool = False, max_output: Optional[int] = None,
                 wrap: bool = False) -> str:
    """Converts the bytes of a file, held in memory, to its XML document.

    `data` is read in place, without a copy, as a file of `kind` ("zelmat" or
    "zelopt"); otherwise as convert(), with the budget reckoned from len(data).
    `ReadError.path` is None.
    """

def convertBytesWithDiagnosis(data: _Data, /, kind: _Kind, *,
                              max_output: Optional[int] = None) -> Tuple[str, Optional[str]]:
    """(text, reason) from one reading of a file's bytes, as convertWithDiagnosis
    gives them for a file."""

def diagnoseBytes(data: _Data, /, kind: _Kind) -> Optional[str]:
    """Tells why the bytes of a file would not convert to an XML document: None
    when they read as a binary file of `kind` ("zelmat" or "zelopt"), else the
    reason, as diagnose() gives it."""

def explain(path: _Path, /, *, kind: Optional[_Kind] = None) -> Dict[str, Any]:
    """Every byte of the file at `path` as its reader reads it: the dict that
    `dexmor explain --json` prints.

    A node has "offset", "size", "name", "kind" ("file", "header", "archive",
    "chunk", "record", "group", "field", "unread" or "failure"), "value" (numbers
    as the XML writes them, text decoded) and "children"; a field also its
    "encoding" and "hex" bytes, a record its "kind_id", "class" and "version",
    a row that only some record versions hold its "held_since" (and
    "held_until" when later versions dropped it), and any node a "note". The top node adds "path", "file_kind",
    "reads_as_binary", "failure" (None, or a dict of "reason", "offset" and
    "record_path") and "cut" (whether the file held more values than an
    explanation keeps). The kind is the extension's unless kind= says; a file
    that cannot be opened raises the OSError that open() raises.
    """
