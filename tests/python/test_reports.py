"""What the tool says about each file: the reason a file passed through as text,
the summary of a batch, --strict, standard input, folders, check --json, list."""
import json
import os
import pathlib
import subprocess

import Dexmor

CLI = os.path.abspath(os.environ["DEXMOR_CLI"]) if "DEXMOR_CLI" in os.environ else "dexmor"
EXAMPLES = pathlib.Path(os.environ.get("DEXMOR_SOURCE_DIR", pathlib.Path(__file__).resolve().parents[2])) / "examples"
SAMPLE = EXAMPLES / "sample.zelmat"
TRUNCATED_REASON = "archive image: the archive ends inside chunk 0 of 3 at offset 12"


def dexmor(*args, **kwargs):
    return subprocess.run([CLI, *map(str, args)], capture_output=True, timeout=120, **kwargs)


def truncated(folder):
    path = folder / "trunc.zelmat"
    path.write_bytes(SAMPLE.read_bytes()[:3000])
    return path


def test_a_file_passed_through_is_named_with_its_reason_and_counted(tmp_path):
    trunc = truncated(tmp_path)
    run = dexmor("xml", "-o", tmp_path / "out", SAMPLE, trunc)
    assert run.returncode == 0
    assert run.stderr.decode().splitlines() == [
        f"dexmor: {trunc}: not a readable material library ({TRUNCATED_REASON}); wrote its text instead (0 bytes)",
        "dexmor: 1 converted, 1 passed through as text, 0 not converted",
    ]
    assert dexmor("xml", "-q", "-o", tmp_path / "out", SAMPLE, trunc).stderr == b""

    # --strict: an error, with nothing written for it, on standard output too.
    run = dexmor("xml", "--strict", "-o", tmp_path / "strict", SAMPLE, trunc)
    assert run.returncode == 3
    assert f"{trunc}: not a readable material library ({TRUNCATED_REASON}); not written (--strict)" in run.stderr.decode()
    assert sorted(os.listdir(tmp_path / "strict")) == ["sample.zelmat.xml"]
    run = dexmor("xml", "--strict", trunc, SAMPLE)
    assert (run.returncode, run.stdout.decode()) == (3, Dexmor.getZelmatXml(str(SAMPLE)))


def test_standard_input_and_names_without_the_extension_take_a_kind(tmp_path):
    expected = Dexmor.getZelmatXml(str(SAMPLE))
    run = dexmor("xml", "--kind", "zelmat", "-", stdin=open(SAMPLE, "rb"))
    assert (run.returncode, run.stdout.decode()) == (0, expected)
    backup = tmp_path / "lib.zelmat.bak"
    backup.write_bytes(SAMPLE.read_bytes())
    assert dexmor("xml", "--kind=zelmat", backup).stdout.decode() == expected
    run = dexmor("xml", "-", stdin=subprocess.DEVNULL)
    assert run.returncode == 2 and b"standard input needs --kind" in run.stderr
    assert dexmor("xml", backup).returncode == 2


def test_a_folder_is_converted_with_its_paths_mirrored(tmp_path):
    for sub in ("a", "b/c"):
        (tmp_path / "in" / sub).mkdir(parents=True)
        (tmp_path / "in" / sub / "same.zelmat").write_bytes(SAMPLE.read_bytes())
    (tmp_path / "in" / "notes.txt").write_text("not ours")
    run = dexmor("xml", "-o", tmp_path / "out", tmp_path / "in")
    assert run.returncode == 0, run.stderr
    written = sorted(str(p.relative_to(tmp_path / "out")) for p in (tmp_path / "out").rglob("*") if p.is_file())
    assert written == ["a/same.zelmat.xml", "b/c/same.zelmat.xml"]
    assert (tmp_path / "out" / "b" / "c" / "same.zelmat.xml").read_text() == Dexmor.getZelmatXml(str(SAMPLE))


def test_check_json_gives_one_object_per_file(tmp_path):
    trunc = truncated(tmp_path)
    run = dexmor("check", "--json", SAMPLE, trunc, EXAMPLES / "sample.zelopt")
    assert run.returncode == 1
    library, damaged, options = map(json.loads, run.stdout.decode().splitlines())
    assert library["reads_as_binary"] and library["description"] == "material library, generation 3, 20 materials"
    assert len(library["warnings"]) == 2  # the sample's material with two layers of one name
    assert damaged == {"path": str(trunc), "kind": "zelmat", "reads_as_binary": False, "description": None,
                       "reason": "the archive ends inside chunk 0 of 3", "offset": 12,
                       "record_path": ["archive image"], "fallback_bytes": 0, "warnings": []}
    assert options["kind"] == "zelopt" and options["warnings"] == []
    assert dexmor("check", "--strict", SAMPLE).returncode == 1  # the warnings count


def test_list_names_the_materials_that_fold_into_no_asset():
    run = dexmor("list", "--json", SAMPLE)
    assert run.returncode == 0
    materials = json.loads(run.stdout)["materials"]
    assert len(materials) == 20
    assert [(m["index"], m["kind"]) for m in materials if m["asset_url"] is None] == [
        (14, "multi material"), (15, "single-BRDF material"), (16, "instance material"), (18, "reference material")]
    assert materials[0] == {"index": 0, "name": "Oak Floor", "kind": "layered material", "asset_url": "/Oak Floor"}
    text = dexmor("list", EXAMPLES / "sample.zelopt").stdout.decode().splitlines()
    assert text[0].endswith("render options, version 23") and "  /SettingsCamera" in text
