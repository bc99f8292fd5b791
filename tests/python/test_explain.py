"""dexmor explain and Dexmor.explain: the same tree, what --offset and --depth
keep, the exit statuses, and a damaged file explained up to its failure."""
import json
import os
import pathlib
import subprocess

import pytest

import Dexmor

CLI = os.path.abspath(os.environ["DEXMOR_CLI"]) if "DEXMOR_CLI" in os.environ else "dexmor"
EXAMPLES = pathlib.Path(os.environ.get("DEXMOR_SOURCE_DIR", pathlib.Path(__file__).resolve().parents[2])) / "examples"
SAMPLE = EXAMPLES / "sample.zelmat"
OPTIONS = EXAMPLES / "sample.zelopt"


def dexmor(*args, **kwargs):
    return subprocess.run([CLI, *map(str, args)], capture_output=True, timeout=120, **kwargs)


def leaves(node):
    if node["kind"] in ("field", "unread"):
        yield node
    for child in node["children"]:
        yield from leaves(child)


def test_the_tool_and_the_module_give_the_same_tree():
    for path in (SAMPLE, OPTIONS):
        run = dexmor("explain", "--json", path)
        assert run.returncode == 0, run.stderr
        assert json.loads(run.stdout) == Dexmor.explain(str(path))
    tree = Dexmor.explain(SAMPLE)
    assert (tree["reads_as_binary"], tree["failure"], tree["cut"]) == (True, None, False)
    # The leaves tile the file.
    end = 0
    for leaf in leaves(tree):
        assert leaf["offset"] == end
        end += leaf["size"]
    assert end == SAMPLE.stat().st_size


def test_a_damaged_file_is_explained_up_to_its_failure(tmp_path):
    damaged = tmp_path / "damaged.zelmat"
    data = bytearray(SAMPLE.read_bytes())
    data[366] = 99  # the kind id of the first material's second BRDF layer
    damaged.write_bytes(bytes(data))
    run = dexmor("explain", damaged)
    assert run.returncode == 1
    lines = run.stdout.decode().splitlines()
    assert lines[-3:] == [
        "          366+4 kind id: Int32 [63 00 00 00] = 99",
        "    370 FAILURE: unknown BRDF layer kind 99 (in material 0 / BRDF layer 1)",
        "    370+11930 unread: undecoded: the reading stopped at the failure",
    ]
    tree = Dexmor.explain(damaged)
    assert tree["failure"] == {"reason": "unknown BRDF layer kind 99", "offset": 370,
                               "record_path": ["material 0", "BRDF layer 1"]}
    # The same words as check.
    assert "material 0 / BRDF layer 1: unknown BRDF layer kind 99 at offset 370" in dexmor("check", damaged).stdout.decode()


def test_offset_and_depth_keep_part_of_the_tree():
    run = dexmor("explain", "--offset", "4100", SAMPLE)
    lines = run.stdout.decode().splitlines()
    # One line per level down to the value holding byte 4100.
    assert lines[0] == "0..12300 material library"
    assert lines[-1].strip().startswith("4100+4 ")
    assert all("crosses into the next chunk at 4108" in line for line in lines[2:-1])
    run = dexmor("explain", "--depth", "1", OPTIONS)
    assert [line.strip() for line in run.stdout.decode().splitlines()] == [
        "0..4096 render options", "0..4096 archive: 1 chunk of 4096 bytes"]


def test_wrong_usage_and_missing_files(tmp_path):
    assert dexmor("explain").returncode == 2
    assert dexmor("explain", SAMPLE, OPTIONS).returncode == 2
    assert dexmor("explain", "--depth", "x", SAMPLE).returncode == 2
    run = dexmor("explain", tmp_path / "missing.zelmat")
    assert run.returncode == 2 and b"not explained" in run.stderr
    with pytest.raises(FileNotFoundError):
        Dexmor.explain(str(tmp_path / "missing.zelmat"))
    # kind= for a name without the extension.
    copy = tmp_path / "lib.bak"
    copy.write_bytes(OPTIONS.read_bytes())
    assert Dexmor.explain(copy, kind="zelopt")["reads_as_binary"]
    with pytest.raises(Dexmor.error):
        Dexmor.explain(copy)
