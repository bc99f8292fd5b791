"""Conversions on several threads at once give the same text as one after another."""
import concurrent.futures
import os
import shutil

import Dexmor

EXAMPLES = os.path.join(os.environ["DEXMOR_SOURCE_DIR"], "examples")


def variants(directory):
    """The sample files, and copies that take the other ways through the readers:
    a name in capitals, a library cut short (read as text), a text document."""
    library = os.path.join(EXAMPLES, "sample.zelmat")
    options = os.path.join(EXAMPLES, "sample.zelopt")
    capitals = directory / "COPY.ZELMAT"
    shutil.copyfile(library, capitals)
    cut = directory / "cut.zelmat"
    with open(library, "rb") as source:
        cut.write_bytes(source.read()[:5000])
    text = directory / "text.zelopt"
    text.write_text("<Assets>\u00e9t\u00e9</Assets>", encoding="utf-8")
    return [library, options, str(capitals), str(cut), str(text)]


def convert(path):
    call = Dexmor.getZeloptXml if path.lower().endswith(".zelopt") else Dexmor.getZelmatXml
    return call(path)


def test_thread_pool_gives_the_serial_results(tmp_path):
    paths = variants(tmp_path)
    serial = {path: convert(path) for path in paths}
    assert serial[paths[0]].startswith("<Assets>") and serial[paths[2]] == serial[paths[0]]
    # Every file many times, in an order that puts each kind beside every other,
    # so that options with sky textures run alongside libraries.
    jobs = [paths[(i * 3 + i // len(paths)) % len(paths)] for i in range(60)]
    with concurrent.futures.ThreadPoolExecutor(4) as pool:
        results = list(pool.map(convert, jobs))
    assert [r == serial[p] for p, r in zip(jobs, results)] == [True] * len(jobs)
