"""Hostile files and unlucky moments, as a user of the tool and the module meets
them: a document that would grow past the output budget, a file whose size lies,
an interrupted or size-limited batch, odd names, a small thread stack, Ctrl-C."""
import os
import pathlib
import resource
import signal
import subprocess
import sys
import textwrap
import threading
import time

import pytest

import Dexmor

CLI = os.path.abspath(os.environ["DEXMOR_CLI"]) if "DEXMOR_CLI" in os.environ else "dexmor"
MAKE_SEEDS = os.environ.get("DEXMOR_MAKE_SEEDS")
SOURCE_DIR = pathlib.Path(os.environ.get("DEXMOR_SOURCE_DIR", pathlib.Path(__file__).resolve().parents[2]))
SAMPLE = SOURCE_DIR / "examples" / "sample.zelmat"
# The deepest chains the reader accepts, from the seed corpus (make_seeds'
# lib_deepest_bump_chain and lib_deepest_texture_chain).
DEEPEST_CHAINS = [SOURCE_DIR / "fuzz" / "corpus" / "fuzz_zelmat" / name
                  for name in ("f2ac6913c78a2bb0fb5a64a0267e285b6096a2cb", "ad8f5f6b53febfa1302eccb3b41877706c4f2c4d")]


def dexmor(*args, stdout=subprocess.PIPE, **kwargs):
    return subprocess.run([CLI, *map(str, args)], stdout=stdout, stderr=subprocess.PIPE, timeout=120, **kwargs)


@pytest.fixture(scope="module")
def amplifier(tmp_path_factory):
    """A 200 KB library whose document would be over half a gigabyte."""
    if not MAKE_SEEDS:
        pytest.skip("needs make_seeds (DEXMOR_MAKE_SEEDS)")
    path = tmp_path_factory.mktemp("hostile") / "amplifier.zelmat"
    subprocess.run([MAKE_SEEDS, "--amplifier", "60000", "3000", str(path)], check=True)
    return path


def budget_message(path, budget):
    return f"dexmor: {path}: the XML would exceed {budget} bytes (the output budget; --max-output to change it)\n"


def test_output_budget_stops_the_tool_with_bounded_memory(amplifier, tmp_path):
    before = resource.getrusage(resource.RUSAGE_CHILDREN).ru_maxrss
    run = dexmor("xml", amplifier, stdout=subprocess.DEVNULL)
    assert (run.returncode, run.stderr.decode()) == (1, budget_message(amplifier, 256 << 20))
    peak = resource.getrusage(resource.RUSAGE_CHILDREN).ru_maxrss
    if peak > before and "LD_PRELOAD" not in os.environ:  # sanitizers keep freed memory on purpose
        assert peak < 64 * 1024, f"peak {peak} KiB"

    run = dexmor("xml", "-q", "--max-output=100000", "-o", tmp_path / "out", SAMPLE)
    assert (run.returncode, run.stderr.decode()) == (1, budget_message(SAMPLE, 100000))
    assert os.listdir(tmp_path / "out") == []  # no output file, no temporary
    run = dexmor("xml", "--max-output", "0", SAMPLE)
    assert (run.returncode, run.stdout.decode()) == (0, Dexmor.getZelmatXml(str(SAMPLE)))


def test_one_material_of_very_many_layers_converts_in_bounded_memory(tmp_path):
    """150,000 layers in 7 MB: their objects alone would take 30 MB more than the file."""
    sanitized = "LD_PRELOAD" in os.environ  # slower, and keeps freed memory on purpose
    path = tmp_path / "layers.zelmat"
    subprocess.run([MAKE_SEEDS, "--amplifier", "1", "5000" if sanitized else "150000", str(path)], check=True)
    outputs = []
    for target in (None, tmp_path / "out"):
        args = ["-o", str(target)] if target else []
        # The peak from /usr/bin/time: a child forked by this interpreter would
        # count the interpreter's own pages from before it ran the tool.
        with open(tmp_path / "stdout.xml", "wb") as stdout:
            run = subprocess.run(["/usr/bin/time", "-f", "%M", "-o", tmp_path / "peak", CLI, "xml", "-q", *args, path],
                                 stdout=stdout, stderr=subprocess.PIPE, timeout=120)
        assert (run.returncode, run.stderr) == (0, b"")
        peak = int((tmp_path / "peak").read_text().split()[-1])
        if not sanitized:
            assert peak * 1024 < path.stat().st_size + (16 << 20), f"peak {peak} KiB"
        outputs.append((target / "layers.zelmat.xml" if target else tmp_path / "stdout.xml").read_bytes())
    assert outputs[0] == outputs[1] == Dexmor.getZelmatXml(str(path)).encode()
    assert outputs[0].count(b"<Asset ") == (5000 if sanitized else 150000) + 1


def test_output_budget_bounds_the_reports_too(amplifier):
    # check and list make the document to survey it: the budget bounds their time.
    for command, done in (("check", "checked"), ("list", "listed")):
        run = dexmor(command, amplifier)
        assert run.returncode == 1
        assert run.stdout.decode() == f"{amplifier}: not {done}, its XML would exceed 268435456 bytes (the output budget)\n"


def test_output_budget_raises_in_the_module(amplifier):
    with pytest.raises(Dexmor.error, match=r"amplifier.zelmat: the XML would exceed 268435456 bytes"):
        Dexmor.getZelmatXml(str(amplifier))
    with pytest.raises(Dexmor.error) as raised:
        Dexmor.convertBytes(amplifier.read_bytes(), "zelmat")
    assert str(raised.value) == "the XML would exceed 268435456 bytes (the output budget; max_output to change it)"


def test_a_file_whose_size_lies_keeps_the_previous_output(tmp_path):
    # The process file system says 0 bytes and delivers more: a short read as far
    # as the size goes, which used to replace a good document with an empty one.
    out = tmp_path / "out"
    out.mkdir()
    (out / "lies.zelmat.xml").write_text("the previous good document")
    (tmp_path / "lies.zelmat").symlink_to("/proc/self/status")
    run = dexmor("xml", "-o", out, tmp_path / "lies.zelmat")
    assert run.returncode == 2
    assert run.stderr.decode().startswith(f"dexmor: {tmp_path / 'lies.zelmat'}: not converted, the file changed while")
    assert (out / "lies.zelmat.xml").read_text() == "the previous good document"
    assert sorted(os.listdir(out)) == ["lies.zelmat.xml"]


@pytest.mark.parametrize("how", [signal.SIGINT, signal.SIGTERM, signal.SIGHUP, signal.SIGKILL])
def test_a_killed_batch_leaves_only_whole_outputs(tmp_path, how):
    inputs = tmp_path / "in"
    inputs.mkdir()
    data = SAMPLE.read_bytes()
    names = [f"lib{i:04}.zelmat" for i in range(400)]
    for name in names:
        (inputs / name).write_bytes(data)
    out = tmp_path / "out"
    tool = subprocess.Popen([CLI, "xml", "-o", str(out), "-j", "2", *(str(inputs / n) for n in names)],
                            stderr=subprocess.DEVNULL)
    while not out.exists() or len(os.listdir(out)) < 20:
        time.sleep(0.01)
        if tool.poll() is not None:
            break
    tool.send_signal(how)
    assert tool.wait(timeout=60) in (-how, 0)
    expected = Dexmor.getZelmatXml(str(SAMPLE))
    left = os.listdir(out)
    assert set(left) <= {n + ".xml" for n in names}, sorted(set(left) - {n + ".xml" for n in names})[:5]
    for name in left:
        assert (out / name).read_text() == expected


def test_a_file_size_limit_fails_the_write_instead_of_killing_the_tool(tmp_path):
    limit = 64 * 1024  # the sample's document is twice that
    run = dexmor("xml", "-o", tmp_path, SAMPLE,
                 preexec_fn=lambda: resource.setrlimit(resource.RLIMIT_FSIZE, (limit, limit)))
    assert run.returncode == 1
    assert b"File too large" in run.stderr
    assert os.listdir(tmp_path) == []


def test_names_up_to_the_file_system_limit_and_control_characters(tmp_path):
    long_name = "n" * (255 - len(".zelmat.xml")) + ".zelmat"
    (tmp_path / long_name).write_bytes(SAMPLE.read_bytes())
    run = dexmor("xml", "-q", "-o", tmp_path / "out", tmp_path / long_name)
    assert (run.returncode, run.stderr) == (0, b"")
    assert os.listdir(tmp_path / "out") == [long_name + ".xml"]

    # A line feed in a name must not forge a line of the report.
    forged = "x.zelmat\nevil.zelmat: material library, generation 3, 1 material\n\x7f.zelmat"
    (tmp_path / forged).write_bytes(b"<Assets/>")
    run = dexmor("check", forged, cwd=tmp_path)
    lines = run.stdout.decode().splitlines()
    assert len(lines) == 1
    assert lines[0].startswith('"x.zelmat\\nevil.zelmat: material library, generation 3, 1 material\\n\\x7f.zelmat": ')


def test_a_closed_standard_output_is_reported_once():
    run = subprocess.run(f"exec {CLI} xml {SAMPLE} {SAMPLE} >&-", shell=True, capture_output=True, timeout=60)
    assert run.returncode == 1
    assert run.stderr.decode().count("cannot write to standard output") == 1


@pytest.mark.parametrize("seed", DEEPEST_CHAINS, ids=["bump materials", "textures"])
def test_the_deepest_chain_converts_on_a_128_kib_thread(tmp_path, seed):
    chain = tmp_path / "chain.zelmat"
    chain.write_bytes(seed.read_bytes())
    assert Dexmor.diagnose(str(chain)) is None  # reads as binary
    expected = Dexmor.getZelmatXml(str(chain))
    assert expected.startswith("<Assets>")
    results = []
    previous = threading.stack_size(128 * 1024)
    try:
        thread = threading.Thread(target=lambda: results.append(Dexmor.getZelmatXml(str(chain))))
        thread.start()
        thread.join()
    finally:
        threading.stack_size(previous)
    assert results == [expected]


@pytest.mark.parametrize("call", ["Dexmor.getZelmatXml(path)", "Dexmor.convert(path, max_output=0)",
                                  "Dexmor.convertBytes(open(path, 'rb').read(), 'zelmat', max_output=0)"])
def test_ctrl_c_interrupts_a_long_call_promptly(amplifier, call):
    program = textwrap.dedent(f"""
        import os, signal, threading, time, Dexmor
        path = {str(amplifier)!r}
        fired = []
        def interrupt():
            fired.append(time.monotonic())
            os.kill(os.getpid(), signal.SIGINT)
        threading.Timer(0.2, interrupt).start()
        try:
            {call}
            print("finished")
        except KeyboardInterrupt:
            print("interrupted after", time.monotonic() - fired[0])
        except Dexmor.error:
            print("finished")
        print(len(Dexmor.getZelmatXml({str(SAMPLE)!r})))
    """)
    run = subprocess.run([sys.executable, "-c", program], capture_output=True, text=True, timeout=120)
    first, second = run.stdout.splitlines()
    assert first.startswith("interrupted after"), (first, run.stderr)
    assert float(first.split()[-1]) < 0.5
    assert int(second) == len(Dexmor.getZelmatXml(str(SAMPLE)))
