"""Dexmor: material libraries (.zelmat) and render-options files (.zelopt) as XML.

Each call takes the path of one stored file and returns text. A file that reads
as a binary file of its kind gives its XML asset document. Any other file is
taken to be XML text already and comes back as it stands: its bytes up to the
first NUL byte, decoded as UTF-8, or as Windows-1252 when they are not UTF-8. A
file that cannot be opened or read in full (missing, unreadable, a directory, a
FIFO) gives the empty string. `diagnose` tells which of these a file is, and why.

A document may have at most the larger of 256 MiB and 1,000 times the file's
size (the output budget; a hostile file can ask for far more): beyond it the
call raises `error`. Ctrl-C interrupts a long call within a fraction of a second.

The calls release the interpreter lock while they convert, so threads run them
in parallel. A path is a `str` or an `os.PathLike` returning `str`; `bytes`
paths raise `TypeError`, a path holding a NUL character raises `ValueError`.
"""

import os
from typing import Optional, Union

_Path = Union[str, "os.PathLike[str]"]

__version__: str

class error(Exception):
    """Raised when a path's extension is not the one the call expects (".zelmat"
    or ".zelopt", in any letter case), when the document would exceed the output
    budget ("PATH: the XML would exceed N bytes (the output budget)"), or when a
    conversion fails for a reason that lies outside the file (running out of
    memory raises MemoryError)."""

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
    'material 4 / layers / BRDF layer 0: unknown BRDF layer kind 41 at offset 1667'.
    The conversion of such a file returns its own text (or "").

    Raises `error` when `path` ends in neither extension.
    """
