"""examples/convert_on_dask.py on a local cluster of two worker processes, with
the workers reading the files or (--send-bytes) this process: every output equals
what the module returns for the file, and the summary lists exactly the files
that passed through as text. Then, in this process, that each file is read once,
and one conversion in an output folder where others have planted links."""
import builtins
import collections
import errno
import logging
import os
import pathlib
import shutil
import stat
import subprocess
import sys
import types

import pytest

pytest.importorskip("dask")
pytest.importorskip("distributed")

import Dexmor

SOURCE = pathlib.Path(os.environ.get("DEXMOR_SOURCE_DIR", pathlib.Path(__file__).parents[2]))
SCRIPT = SOURCE / "examples" / "convert_on_dask.py"


def convert(path):
    call = Dexmor.getZelmatXml if path.suffix.lower() == ".zelmat" else Dexmor.getZeloptXml
    return call(str(path))


def variant(sample, offset, data):
    changed = bytearray(sample)
    changed[offset: offset + len(data)] = data
    return bytes(changed)


def make_inputs(folder):
    """50 files: copies of the two samples under other names, and ten that do not
    read as binary. Returns the names of those ten."""
    zelmat = (SOURCE / "examples" / "sample.zelmat").read_bytes()
    zelopt = (SOURCE / "examples" / "sample.zelopt").read_bytes()
    for i in range(20):
        (folder / f"library {i:02}.{'ZELMAT' if i % 5 == 0 else 'zelmat'}").write_bytes(zelmat)
        (folder / f"scene-{i:02}.zelopt").write_bytes(zelopt)
    fallbacks = {
        "text.zelmat": b'<?xml version="1.0"?>\n<Assets>\n  <Asset url="/a&amp;b"/>\n</Assets>\n',
        "utf8.zelopt": "<Assets name='Grüße 東京'/>".encode("utf-8"),
        "cp1252.zelmat": b"<Assets name='caf\xe9 \x80 \x81'/>",
        "empty.zelopt": b"",
        "nul-cut.zelopt": b"<Assets/>\0hidden",
        "generation 9.zelmat": variant(zelmat, 2, b"\x09\x00"),
        "unknown kind.zelmat": variant(zelmat, 12, (99).to_bytes(4, "little")),
        "truncated.zelmat": zelmat[:5000],
        "options version.zelopt": variant(zelopt, 2, b"\xff\xff"),
        "no materials.zelmat": variant(zelmat, 4, b"\0\0\0\0"),
    }
    for name, data in fallbacks.items():
        (folder / name).write_bytes(data)
    (folder / "notes.txt").write_text("not an input")
    (folder / "folder.zelmat").mkdir()  # neither is converted
    return set(fallbacks)


@pytest.mark.parametrize("mode", [[], ["--send-bytes"]], ids=["paths", "send-bytes"])
def test_converts_a_folder_on_two_worker_processes(tmp_path, mode):
    inputs, out, elsewhere = tmp_path / "in", tmp_path / "out", tmp_path / "elsewhere"
    inputs.mkdir()
    elsewhere.mkdir()
    fallbacks = make_inputs(inputs)
    files = sorted(p for p in inputs.iterdir() if p.is_file() and p.suffix.lower() in (".zelmat", ".zelopt"))
    assert len(files) == 50
    # Beside the folder, paths that are reported and not converted: a second file of
    # an input's name (its document would replace the first one's), a name with
    # neither extension, a missing file.
    shutil.copy(inputs / "empty.zelopt", elsewhere / "empty.zelopt")
    (elsewhere / "notes.txt").write_text("x")
    refused = [elsewhere / "empty.zelopt", elsewhere / "notes.txt", elsewhere / "missing.zelmat"]

    run = subprocess.run([sys.executable, str(SCRIPT), *mode, "--workers", "2", "--batch-size", "4", "-o", str(out),
                          str(inputs), *map(str, refused)], capture_output=True, text=True, timeout=600)
    assert run.returncode == 1, run.stderr
    assert run.stdout.startswith("50 of 50 files converted on 2 workers"), run.stdout
    # Dask may add lines of its own (a slow event loop on a loaded machine).
    problems = sorted(line for line in run.stderr.splitlines() if line.startswith("convert_on_dask: "))
    assert len(problems) == 3, run.stderr
    assert "empty.zelopt: not written" in problems[0] and "already holds the document of" in problems[0]
    assert "missing.zelmat: not converted" in problems[1] and "notes.txt: not converted" in problems[2]

    written = {p.name for p in out.iterdir()}
    assert written == {f.name + ".xml" for f in files} | {"text-fallbacks.tsv"}
    for f in files:
        assert (out / (f.name + ".xml")).read_bytes() == convert(f).encode("utf-8"), f.name

    header, *rows = (out / "text-fallbacks.tsv").read_text(encoding="utf-8").splitlines()
    assert header == "file\treason\toutput_bytes"
    listed = {}
    for row in rows:
        path, reason, size = row.split("\t")
        listed[pathlib.Path(path).name] = (reason, int(size))
    assert set(listed) == fallbacks
    for name, (reason, size) in listed.items():
        assert size == len(convert(inputs / name).encode("utf-8"))
        assert reason == " ".join(Dexmor.diagnose(str(inputs / name)).split())


def load_script():
    # The example as a module of its own, without running its command line.
    script = types.ModuleType("convert_on_dask")
    script.__file__ = str(SCRIPT)
    exec(compile(SCRIPT.read_text(encoding="utf-8"), str(SCRIPT), "exec"), script.__dict__)
    return script


@pytest.mark.filterwarnings("ignore:make_current is deprecated:DeprecationWarning")
@pytest.mark.parametrize("mode", [[], ["--send-bytes"]], ids=["paths", "send-bytes"])
def test_each_file_is_read_once(tmp_path, monkeypatch, mode):
    """On a cluster of one thread in this process: every file is read once, by the
    worker's one call of the module or, with --send-bytes, by this process's one
    open(); a file that cannot be opened fails and gets no output."""
    from distributed import Client, LocalCluster

    script = load_script()
    inputs, out = tmp_path / "in", tmp_path / "out"
    inputs.mkdir()
    out.mkdir()
    make_inputs(inputs)
    files = sorted(str(p) for p in inputs.iterdir() if p.is_file() and p.suffix.lower() in (".zelmat", ".zelopt"))
    gone = str(inputs / "gone.zelmat")

    reads, bytes_calls = collections.Counter(), []

    def recording(function):
        def call(first, *args, **kwargs):
            if isinstance(first, (bytes, bytearray, memoryview)):
                bytes_calls.append(function.__name__)
            else:
                reads[os.fspath(first)] += 1
            return function(first, *args, **kwargs)
        return call

    for name in dir(Dexmor):
        if not name.startswith("_") and not isinstance(getattr(Dexmor, name), type):
            monkeypatch.setattr(Dexmor, name, recording(getattr(Dexmor, name)))
    real_open = builtins.open

    def counting_open(file, *args, **kwargs):
        if isinstance(file, (str, os.PathLike)):
            reads[os.fspath(file)] += 1
        return real_open(file, *args, **kwargs)

    monkeypatch.setattr(builtins, "open", counting_open)

    def in_this_process(args):
        cluster = LocalCluster(n_workers=1, threads_per_worker=1, processes=False, dashboard_address=None,
                               silence_logs=logging.ERROR)
        return Client(cluster), cluster

    monkeypatch.setattr(script, "connect", in_this_process)
    jobs, _ = script.plan(files + [gone], str(out))
    results, _ = script.run(jobs, script.parse_arguments([*mode, "--batch-size", "4", "-o", str(out), "in"]))
    monkeypatch.undo()

    assert {path: reads[path] for path in files} == dict.fromkeys(files, 1)
    assert bytes_calls == (["convertBytesWithDiagnosis"] * len(files) if mode else [])
    outcomes = {source: (outcome, detail) for source, outcome, detail, _ in results}
    assert len(results) == len(outcomes) == len(files) + 1
    assert outcomes[gone][0] == "failed" and outcomes[gone][1].startswith("FileNotFoundError"), outcomes[gone]
    assert sorted(os.listdir(out)) == sorted(os.path.basename(f) + ".xml" for f in files)


def test_output_folder_with_planted_links(tmp_path, monkeypatch):
    """Links planted at names the temporary file could take are neither written
    through nor renamed onto the target, which gets the mode a plain open gives;
    a write that fails leaves the previous target and no temporary file."""
    script = load_script()
    sample = SOURCE / "examples" / "sample.zelmat"
    expected = convert(sample).encode("utf-8")
    victim, out = tmp_path / "victim", tmp_path / "out"
    victim.write_bytes(b"not yours")
    out.mkdir()
    target = out / "sample.zelmat.xml"
    planted = [f"{target.name}.{os.getpid()}.tmp", f"{target.name}.tmp", f".{target.name}.tmp", f"{target.name}~"]
    for name in planted:
        (out / name).symlink_to(victim)

    umask = os.umask(0o027)
    try:
        assert script.convert_one(str(sample), str(target))[1] == "xml"
    finally:
        os.umask(umask)
    assert victim.read_bytes() == b"not yours"
    assert not target.is_symlink() and target.read_bytes() == expected
    assert stat.S_IMODE(target.lstat().st_mode) == 0o640
    assert sorted(os.listdir(out)) == sorted(planted + [target.name])

    def disk_full(descriptor):
        raise OSError(errno.ENOSPC, os.strerror(errno.ENOSPC))

    monkeypatch.setattr(os, "fsync", disk_full)
    _, outcome, detail, _ = script.convert_one(str(SOURCE / "examples" / "sample.zelopt"), str(target))
    monkeypatch.undo()
    assert outcome == "failed" and "No space left on device" in detail, detail
    assert target.read_bytes() == expected
    assert sorted(os.listdir(out)) == sorted(planted + [target.name])
