"""Prints where `cmake --install` puts the Python module for the prefix given:
the user site when the prefix is the interpreter's user base (~/.local), so
that `import Dexmor` works after installing there; otherwise the interpreter's
directory for extension modules under the prefix (on Debian
lib/python3.X/dist-packages, on the path under /usr and /usr/local)."""
import os
import site
import sys
import sysconfig

prefix = os.path.realpath(sys.argv[1])
if prefix == os.path.realpath(site.getuserbase()):
    print(site.getusersitepackages(), end="")
else:
    get_scheme = getattr(sysconfig, "get_default_scheme", None) or sysconfig._get_default_scheme
    scheme = get_scheme()
    # Debian's default scheme puts an interpreter of prefix /usr at /usr/local.
    base = os.path.join(sys.prefix, "local") if scheme == "posix_local" else sys.prefix
    relative = os.path.relpath(sysconfig.get_path("platlib", scheme), base)
    if relative.startswith(".."):
        relative = os.path.relpath(sysconfig.get_path("platlib"), sys.prefix)
    print(os.path.join(prefix, relative), end="")
