#!/usr/bin/env python3
"""Checks that the code keeps its layers: a folder includes only itself and the
folders below it.

    platform -> archive -> xml -> model -> params -> lights -> textures
             -> brdfs -> materials -> options -> files -> cli, module

Headers of the interface live in include/dexmor/<layer>/ (the front header and
the version header at include/dexmor/ belong to files), sources and private
headers in core/<layer>/. Also checked: a public header never includes a
private one, and cmake/DexmorPublicHeaders.cmake lists exactly the headers
under include/dexmor/.

Usage: check_layers.py [ROOT]   (exit status 1, one line per fault, on failure)
"""
import pathlib
import re
import sys

LAYERS = ["platform", "archive", "xml", "model", "params", "lights", "textures",
          "brdfs", "materials", "options", "files", "cli", "module"]
RANK = {name: rank for rank, name in enumerate(LAYERS)}
RANK["module"] = RANK["cli"]  # side by side at the top

INCLUDE = re.compile(r'^\s*#\s*include\s*([<"])([^>"]+)[>"]')
GENERATED = {"version.hpp"}  # made by the build in <build>/include/dexmor/


def layer_of_header(name):
    """The layer of an included name: <dexmor/x/Y.hpp>, "x/Y.hpp" or None."""
    parts = name.split("/")
    if parts[0] == "dexmor":
        parts = parts[1:]
        if len(parts) == 1:
            return "files"
    return parts[0] if len(parts) >= 2 and parts[0] in RANK else None


def layer_of_file(root, path):
    rel = path.relative_to(root).parts
    if rel[0] == "include":
        return "files" if len(rel) == 3 else rel[2]
    if rel[0] == "core":
        return rel[1]
    return rel[0]


def faults(root):
    root = pathlib.Path(root)
    found = []
    files = [p for d in ("include/dexmor", "core", "cli", "module") for p in sorted((root / d).rglob("*"))
             if p.suffix in (".hpp", ".cpp")]
    for path in files:
        own = layer_of_file(root, path)
        public = path.relative_to(root).parts[0] == "include"
        for number, line in enumerate(path.read_text(encoding="utf-8").splitlines(), 1):
            match = INCLUDE.match(line)
            if not match:
                continue
            bracket, name = match.groups()
            target = layer_of_header(name)
            if target is None:
                continue
            where = f"{path.relative_to(root)}:{number}"
            if RANK[target] > RANK[own]:
                found.append(f"{where}: {own}/ includes {name}, a layer above it ({target}/)")
            if public and bracket == '"':
                found.append(f"{where}: a public header includes the private header {name}")
    listed = (root / "cmake/DexmorPublicHeaders.cmake").read_text(encoding="utf-8")
    listed = set(re.search(r"set\(DEXMOR_PUBLIC_HEADERS\n(.*?)\)", listed, re.S).group(1).split())
    present = {p.relative_to(root / "include/dexmor").as_posix() for p in (root / "include/dexmor").rglob("*.hpp")}
    for name in sorted(present - listed - GENERATED):
        found.append(f"include/dexmor/{name}: not listed in cmake/DexmorPublicHeaders.cmake")
    for name in sorted(listed - present):
        found.append(f"cmake/DexmorPublicHeaders.cmake: lists {name}, which is not in include/dexmor/")
    return found


def main():
    root = sys.argv[1] if len(sys.argv) > 1 else pathlib.Path(__file__).resolve().parent.parent
    problems = faults(root)
    for problem in problems:
        print(problem)
    if problems:
        return 1
    print("layers: every include runs downward")
    return 0


if __name__ == "__main__":
    sys.exit(main())
