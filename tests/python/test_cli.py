"""The dexmor command-line tool: what it writes, where, and its exit statuses."""
import os
import pathlib
import re
import subprocess

import pytest

import Dexmor

CLI = os.path.abspath(os.environ["DEXMOR_CLI"]) if "DEXMOR_CLI" in os.environ else "dexmor"
SOURCE_DIR = pathlib.Path(os.environ.get("DEXMOR_SOURCE_DIR", pathlib.Path(__file__).resolve().parents[2]))

SAMPLES = {
    "a.zelmat": b'<?xml version="1.0"?>\n<Assets>\n</Assets>\n',
    "b.ZelOpt": "<Assets name='Grüße 🎨'/>".encode("utf-8"),
    "c.zelmat": b"<Assets name='caf\xe9 \x80'/>",
    "d.zelopt": b"<Assets/>\0after the nul",
    "e.zelmat": b"",
}


def dexmor(*args, stdout=subprocess.PIPE, cwd=None):
    return subprocess.run([CLI, *map(str, args)], stdout=stdout, stderr=subprocess.PIPE, cwd=cwd, timeout=60)


def module_text(path):
    call = Dexmor.getZelmatXml if str(path).lower().endswith(".zelmat") else Dexmor.getZeloptXml
    return call(str(path))


@pytest.fixture
def samples(tmp_path):
    for name, data in SAMPLES.items():
        (tmp_path / name).write_bytes(data)
    return [tmp_path / name for name in SAMPLES]


def test_stdout_is_the_module_text_of_each_file_in_order(samples):
    for order in (samples, samples[::-1]):
        run = dexmor("xml", "-q", *order)
        assert (run.returncode, run.stderr) == (0, b"")
        assert run.stdout.decode("utf-8") == "".join(module_text(p) for p in order)


@pytest.mark.parametrize("bad", ["notes.txt", "missing.zelmat", "folder.zelmat"])
def test_file_not_converted_is_reported_and_the_rest_still_are(samples, tmp_path, bad):
    (tmp_path / "notes.txt").write_bytes(b"<Assets/>")
    (tmp_path / "folder.zelmat").mkdir()
    run = dexmor("xml", samples[0], tmp_path / bad, samples[1])
    assert run.returncode == 2
    assert str(tmp_path / bad).encode() in run.stderr
    assert run.stdout.decode("utf-8") == module_text(samples[0]) + module_text(samples[1])


def test_double_dash_ends_options(tmp_path):
    (tmp_path / "-o.zelmat").write_bytes(b"<Assets/>")
    run = dexmor("xml", "--", "-o.zelmat", cwd=tmp_path)
    assert (run.returncode, run.stdout) == (0, b"<Assets/>")


@pytest.mark.parametrize("args", [["xml", "a.zelmat"], ["--help"]])
def test_full_disk_on_stdout_is_a_failure(samples, args):
    with open("/dev/full", "wb") as full:
        run = dexmor(*args, stdout=full, cwd=samples[0].parent)
    assert run.returncode == 1
    assert b"No space left on device" in run.stderr


@pytest.mark.parametrize("form", [["-o", "{}"], ["--output={}/"]])
def test_output_directory_gets_one_document_per_file(samples, tmp_path, form):
    out = tmp_path / "new" / "nested"
    run = dexmor("xml", *[a.format(out) for a in form], *samples)
    assert (run.returncode, run.stdout) == (0, b""), run.stderr
    assert sorted(p.name for p in out.iterdir()) == sorted(p.name + ".xml" for p in samples)
    for path in samples:
        assert (out / (path.name + ".xml")).read_bytes().decode("utf-8") == module_text(path)


def test_output_directory_that_is_a_file_fails(samples, tmp_path):
    blocker = tmp_path / "taken"
    blocker.write_bytes(b"keep me")
    run = dexmor("xml", "-o", blocker, samples[0])
    assert run.returncode == 1
    assert str(blocker).encode() in run.stderr
    assert blocker.read_bytes() == b"keep me"


def test_two_files_with_one_output_name_do_not_overwrite_each_other(tmp_path):
    first, second = tmp_path / "one" / "lib.zelmat", tmp_path / "two" / "lib.zelmat"
    for path, text in ((first, b"<first/>"), (second, b"<second/>")):
        path.parent.mkdir()
        path.write_bytes(text)
    run = dexmor("xml", "-o", tmp_path / "out", first, second)
    assert run.returncode == 1
    assert str(second).encode() in run.stderr
    assert (tmp_path / "out" / "lib.zelmat.xml").read_bytes() == b"<first/>"
    assert dexmor("xml", "-o", tmp_path / "out", first, first).returncode == 0


@pytest.mark.parametrize(
    "args",
    [[], ["convert", "a.zelmat"], ["--frobnicate"], ["xml"], ["xml", "--frobnicate", "a.zelmat"],
     ["xml", "a.zelmat", "-o"], ["xml", "-o", "d1", "-o", "d2", "a.zelmat"], ["xml", "-o", "", "a.zelmat"],
     ["xml", "-o", "d1"]],
)
def test_usage_errors(tmp_path, args):
    run = dexmor(*args, cwd=tmp_path)
    assert (run.returncode, run.stdout) == (2, b"")
    assert run.stderr.startswith(b"dexmor: ")
    assert list(tmp_path.iterdir()) == []  # no output directory was made


@pytest.mark.parametrize("args", [["--help"], ["-h"], ["xml", "--help"]])
def test_help(args):
    run = dexmor(*args)
    assert run.returncode == 0
    for word in ("xml", "-o DIR", ".zelmat", ".zelopt", "--version", "dexmor xml -o"):
        assert word in run.stdout.decode()


def test_tool_and_module_give_the_project_version():
    project = re.search(r"project\(Dexmor VERSION ([0-9.]+)", (SOURCE_DIR / "CMakeLists.txt").read_text())
    version = project.group(1)
    run = dexmor("--version")
    assert (run.returncode, run.stdout.decode()) == (0, f"dexmor {version}\n")
    import Dexmor

    assert Dexmor.__version__ == version


def test_parallel_jobs_write_the_same_documents(tmp_path):
    examples = SOURCE_DIR / "examples"
    inputs = []
    for i in range(12):  # the samples and text files under several names
        source = examples / ("sample.zelmat", "sample.zelopt")[i % 2]
        target = tmp_path / "in" / f"f{i}{source.suffix}"
        target.parent.mkdir(exist_ok=True)
        target.write_bytes(source.read_bytes() if i % 3 else b"<Assets n='%d'/>" % i)
        inputs.append(target)
    outputs = {}
    for jobs in ("1", "2", "5"):
        run = dexmor("xml", "-q", "-o", tmp_path / jobs, "-j", jobs, *inputs)
        assert (run.returncode, run.stderr) == (0, b"")
        outputs[jobs] = {p.name: p.read_bytes() for p in (tmp_path / jobs).iterdir()}
    assert outputs["1"] == outputs["2"] == outputs["5"]
    assert outputs["1"]["f1.zelopt.xml"].decode() == module_text(inputs[1])

    # A system that gives fewer threads than asked for: those it gave (or the
    # main thread alone) do all the work.
    limit = os.environ.get("DEXMOR_THREAD_LIMIT")
    if not limit:
        pytest.skip("DEXMOR_THREAD_LIMIT names no thread-limiting library")
    env = dict(os.environ, LD_PRELOAD=":".join(filter(None, [limit, os.environ.get("LD_PRELOAD")])),
               ASAN_OPTIONS=os.environ.get("ASAN_OPTIONS", "") + ":verify_asan_link_order=0")
    for threads in ("0", "1"):
        target = tmp_path / f"limited{threads}"
        run = subprocess.run([CLI, "xml", "-q", "-o", target, "-j", "5", *inputs], stderr=subprocess.PIPE,
                             env=dict(env, DEXMOR_TEST_THREADS=threads), timeout=60)
        assert (run.returncode, run.stderr) == (0, b"")
        assert {p.name: p.read_bytes() for p in target.iterdir()} == outputs["1"]


def test_output_files_match_standard_output_for_damaged_libraries(tmp_path):
    # Into -o a library is read once and what it wrote is dropped if a later
    # record fails; on standard output it is read twice and nothing is sent early.
    sample = (SOURCE_DIR / "examples" / "sample.zelmat").read_bytes()
    inputs = []
    for i, at in enumerate(range(len(sample) // 3, len(sample), len(sample) // 9)):
        damaged = bytearray(sample)
        damaged[at] ^= 0x5A
        inputs.append(tmp_path / f"d{i}.zelmat")
        inputs[-1].write_bytes(bytes(damaged))
    run = dexmor("xml", "-q", "-o", tmp_path / "out", *inputs)
    assert (run.returncode, run.stderr) == (0, b"")
    for path in inputs:
        assert (tmp_path / "out" / (path.name + ".xml")).read_bytes() == dexmor("xml", path).stdout


@pytest.mark.parametrize("jobs", ["0", "x", "-1", "2000"])
def test_bad_job_counts_are_usage_errors(tmp_path, jobs):
    run = dexmor("xml", "-o", tmp_path / "out", "-j", jobs, "a.zelmat", cwd=tmp_path)
    assert (run.returncode, run.stdout) == (2, b"")
    assert not (tmp_path / "out").exists()


def test_progress_line_only_on_a_terminal(samples, tmp_path):
    import pty

    run = dexmor("xml", "--no-progress", "-o", tmp_path / "plain", *samples)
    assert b"files" not in run.stderr  # not a terminal: no progress line
    leader, follower = pty.openpty()
    try:
        process = subprocess.run([CLI, "xml", "-o", tmp_path / "tty", *samples], stderr=follower,
                                 stdout=subprocess.DEVNULL, timeout=60)
        os.close(follower)
        shown = b""
        try:
            while chunk := os.read(leader, 4096):
                shown += chunk
        except OSError:  # the terminal closed
            pass
    finally:
        os.close(leader)
    assert process.returncode == 0
    assert b"5/5 files" in shown and shown.endswith(b"\n")
