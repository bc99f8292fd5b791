"""The layer check of the code: passes on the tree, names the file and line of an
include that runs upward."""
import os
import pathlib
import shutil
import subprocess
import sys

SOURCE = pathlib.Path(os.environ.get("DEXMOR_SOURCE_DIR", pathlib.Path(__file__).resolve().parents[2]))
CHECK = SOURCE / "tools" / "check_layers.py"


def run(root):
    return subprocess.run([sys.executable, str(CHECK), str(root)], capture_output=True, text=True)


def copy_of_tree(tmp_path):
    root = tmp_path / "tree"
    for part in ("include", "core", "cli", "module"):
        shutil.copytree(SOURCE / part, root / part)
    (root / "cmake").mkdir()
    shutil.copy(SOURCE / "cmake" / "DexmorPublicHeaders.cmake", root / "cmake")
    return root


def test_the_tree_keeps_its_layers():
    result = run(SOURCE)
    assert result.returncode == 0, result.stdout


def test_an_upward_include_fails_naming_file_and_line(tmp_path):
    root = copy_of_tree(tmp_path)
    source = root / "core" / "xml" / "NumberFormat.cpp"
    lines = source.read_text().count("\n")
    with source.open("a") as out:
        out.write('#include <dexmor/materials/BaseMaterial.hpp>\n')
    result = run(root)
    assert result.returncode == 1
    assert f"core/xml/NumberFormat.cpp:{lines + 1}: xml/ includes dexmor/materials/BaseMaterial.hpp" in result.stdout


def test_a_public_header_must_not_reach_a_private_one_and_must_be_listed(tmp_path):
    root = copy_of_tree(tmp_path)
    header = root / "include" / "dexmor" / "params" / "Extra.hpp"
    header.write_text('#pragma once\n#include "platform/FileIo.hpp"\n')
    result = run(root)
    assert "include/dexmor/params/Extra.hpp:2: a public header includes the private header" in result.stdout
    assert "include/dexmor/params/Extra.hpp: not listed" in result.stdout


def test_the_front_header_needs_no_boost():
    # The generated version header is in the build tree, beside the tool.
    build = pathlib.Path(os.environ["DEXMOR_CLI"]).resolve().parents[1]
    compiler = shutil.which("c++") or shutil.which("g++")
    result = subprocess.run(
        [compiler, "-std=c++20", "-x", "c++", "-fsyntax-only", "-H", f"-I{SOURCE / 'include'}",
         f"-I{build / 'include'}", "-"],
        input="#include <dexmor/dexmor.hpp>\n", capture_output=True, text=True)
    assert result.returncode == 0, result.stderr
    included = [line for line in result.stderr.splitlines() if line.startswith(".")]
    assert included and not [line for line in included if "boost/" in line]
