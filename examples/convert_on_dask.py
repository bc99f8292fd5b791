#!/usr/bin/env python3
"""Converts material libraries (.zelmat) and render-options files (.zelopt) to XML
on a Dask cluster, through the Python module Dexmor.

    convert_on_dask.py -o OUT FOLDER_OR_FILE...                          # a local cluster
    convert_on_dask.py -o OUT --scheduler tcp://HOST:8786 FOLDER_OR_FILE...

Each argument is a file, or a folder whose .zelmat and .zelopt files (directly in
it, any letter case) are all converted. Every file gives OUT/<file name>.xml, the
same text that `dexmor xml -o OUT` writes and that Dexmor.getZelmatXml /
getZeloptXml return. OUT/text-fallbacks.tsv lists the files that did not read as
binary and were passed through as text (or as the empty text), each with the
reason that Dexmor.diagnose gives where the module has it.

Without --scheduler the script starts a cluster of worker processes on this
machine (--workers, default: the number of processors). With it, it connects to
a running cluster. The workers read the inputs and write the outputs
themselves, so every path must name the same file on every worker (a shared
file system), and the workers need the module Dexmor installed; this machine
does not. Each worker runs one conversion at a time per thread; the module
releases the interpreter lock, so --threads above 1 also runs in parallel.

Exit status: 0 when every output was written (files passed through as text
count as written), 1 when some were not, 2 for wrong usage.

Needs Debian's python3-dask and python3-distributed.
"""
import argparse
import logging
import os
import sys
import tempfile
import time

EXTENSIONS = (".zelmat", ".zelopt")
SUMMARY_NAME = "text-fallbacks.tsv"

# ---- on the workers --------------------------------------------------------------

# Windows-1252 where it differs from Latin-1 (0x80 to 0x9F); its five undefined
# bytes stay the code points of the same number, as the conversion maps them.
_CP1252_HIGH = {b: bytes([b]).decode("cp1252") for b in range(0x80, 0xA0) if b not in (0x81, 0x8D, 0x8F, 0x90, 0x9D)}


def own_text(path):
    """The text the conversion returns for a file that does not read as binary:
    its bytes up to the first NUL, as UTF-8, or as Windows-1252 when they are not
    UTF-8; "" when the file cannot be read."""
    data = bytearray()
    try:
        with open(path, "rb") as file:
            while True:  # a binary file has its first NUL within a few bytes
                block = file.read(1 << 20)
                nul = block.find(0)
                if nul >= 0:
                    data += block[:nul]
                    break
                if not block:
                    break
                data += block
    except OSError:
        return ""
    try:
        return data.decode("utf-8")
    except UnicodeDecodeError:
        return data.decode("latin-1").translate(_CP1252_HIGH)


def current_umask():
    """This process's umask, read where the system shows it, as setting it to read
    it races with the other threads of a worker creating files."""
    try:
        with open("/proc/self/status", encoding="ascii") as status:
            for line in status:
                if line.startswith("Umask:"):
                    return int(line.split()[1], 8)
    except (OSError, ValueError, IndexError):
        pass
    mask = os.umask(0o077)  # while it is set, a file made elsewhere gets fewer rights, never more
    os.umask(mask)
    return mask


def write_atomically(target, data):
    """Writes the whole file beside the target under a new, unpredictable name,
    then renames it into place. The name is created exclusively, so nothing planted
    there beforehand (a link to another file, say) is written through or moved
    onto the target. On failure the temporary file goes and the target stays."""
    folder, name = os.path.split(target)
    descriptor, temporary = tempfile.mkstemp(prefix=f".{name}.", suffix=".tmp", dir=folder or None)
    try:
        with os.fdopen(descriptor, "wb") as file:
            file.write(data)
            file.flush()
            # mkstemp makes the file 0600; give it the mode a plain open would.
            os.fchmod(file.fileno(), 0o666 & ~current_umask())
            os.fsync(file.fileno())
        os.replace(temporary, target)
    except BaseException:
        try:
            os.unlink(temporary)
        except OSError:
            pass
        raise


def convert_one(source, target):
    """Converts one file; returns (source, outcome, detail, bytes written), where
    outcome is "xml", "text" (passed through; detail is the reason) or "failed"."""
    import Dexmor

    convert = Dexmor.getZelmatXml if source.lower().endswith(".zelmat") else Dexmor.getZeloptXml
    try:
        xml = convert(source)
    except (Dexmor.error, OSError, ValueError, TypeError, MemoryError) as failure:
        return source, "failed", f"{type(failure).__name__}: {failure}", 0
    data = xml.encode("utf-8")
    try:
        write_atomically(target, data)
    except OSError as failure:
        return source, "failed", f"cannot write {target}: {failure.strerror or failure}", 0
    # A document made from binary records never equals the file's own text: the
    # records of both kinds begin with a NUL byte within their first two bytes.
    if xml != own_text(source):
        return source, "xml", None, len(data)
    diagnose = getattr(Dexmor, "diagnose", None)
    reason = diagnose(source) if diagnose is not None else None
    return source, "text", reason or "not readable as binary", len(data)


def convert_batch(jobs):
    """A task: converts each (source, target) pair of the batch."""
    return [convert_one(source, target) for source, target in jobs]


# ---- on the client ---------------------------------------------------------------


def collect_inputs(arguments):
    """The files to convert, as absolute paths, and the problems found on the way."""
    files, problems = [], []
    for argument in arguments:
        path = os.path.abspath(argument)
        if os.path.isdir(path):
            with os.scandir(path) as entries:
                found = sorted(e.path for e in entries if e.name.lower().endswith(EXTENSIONS) and e.is_file())
            files.extend(found)
        elif not argument.lower().endswith(EXTENSIONS):
            problems.append(f"{argument}: not converted, the name ends in neither .zelmat nor .zelopt")
        elif not os.path.isfile(path):
            problems.append(f"{argument}: not converted, it is missing or not a regular file")
        else:
            files.append(path)
    return files, problems


def plan(files, output_dir):
    """(source, target) pairs; a second file with the same name is refused, as its
    document would replace the first one's."""
    jobs, problems, taken = [], [], {}
    for source in dict.fromkeys(files):  # each path once, in order
        target = os.path.join(output_dir, os.path.basename(source) + ".xml")
        if target in taken:
            problems.append(f"{source}: not written, {target} already holds the document of {taken[target]}")
            continue
        taken[target] = source
        jobs.append((source, target))
    return jobs, problems


def connect(args):
    """A client of the cluster at --scheduler, or of a new local cluster."""
    from distributed import Client, LocalCluster

    if args.scheduler:
        return Client(args.scheduler), None
    cluster = LocalCluster(n_workers=args.workers, threads_per_worker=args.threads, processes=True,
                           host="127.0.0.1", dashboard_address=None, silence_logs=logging.ERROR)
    return Client(cluster), cluster


def run(jobs, args):
    """Converts every job on the cluster; one result per job, in any order."""
    from distributed import as_completed

    client, cluster = connect(args)
    try:
        batches = [jobs[i: i + args.batch_size] for i in range(0, len(jobs), args.batch_size)]
        futures = {client.submit(convert_batch, batch, pure=False): batch for batch in batches}
        results = []
        for future in as_completed(futures):
            if future.status == "finished":
                results.extend(future.result())
            else:  # the task itself failed: a worker died, or the module is missing there
                failure = future.exception()
                results.extend((source, "failed", f"{type(failure).__name__}: {failure}", 0)
                               for source, _ in futures[future])
        return results, len(client.scheduler_info()["workers"])
    finally:
        client.close()
        if cluster is not None:
            cluster.close()


def write_summary(path, fallbacks):
    def cell(text):
        return " ".join(str(text).split())  # one line, no tabs

    lines = ["file\treason\toutput_bytes\n"]
    lines += [f"{cell(source)}\t{cell(reason)}\t{size}\n" for source, _, reason, size in sorted(fallbacks)]
    write_atomically(path, "".join(lines).encode("utf-8"))


def parse_arguments(argv):
    parser = argparse.ArgumentParser(description=__doc__,
                                     formatter_class=argparse.RawDescriptionHelpFormatter)
    parser.add_argument("inputs", nargs="+", metavar="FOLDER_OR_FILE")
    parser.add_argument("-o", "--output", required=True, metavar="DIR",
                        help="where the XML files go (created when missing)")
    parser.add_argument("--scheduler", metavar="ADDRESS",
                        help="address of a running Dask scheduler, such as tcp://scheduler-host:8786; "
                             "without it a local cluster is started")
    parser.add_argument("--workers", type=int, default=os.cpu_count() or 1, metavar="N",
                        help="worker processes of the local cluster (default: %(default)s)")
    parser.add_argument("--threads", type=int, default=1, metavar="N",
                        help="threads per worker process of the local cluster (default: %(default)s)")
    parser.add_argument("--batch-size", type=int, default=8, metavar="N",
                        help="files converted by one task (default: %(default)s)")
    parser.add_argument("--summary", metavar="FILE",
                        help=f"the list of files passed through as text (default: DIR/{SUMMARY_NAME})")
    args = parser.parse_args(argv)
    for name in ("workers", "threads", "batch_size"):
        if getattr(args, name) < 1:
            parser.error(f"--{name.replace('_', '-')} must be at least 1")
    return args


def main(argv=None):
    args = parse_arguments(argv)
    output_dir = os.path.abspath(args.output)
    summary = os.path.abspath(args.summary or os.path.join(output_dir, SUMMARY_NAME))
    files, problems = collect_inputs(args.inputs)
    jobs, refused = plan(files, output_dir)
    problems += refused
    try:
        os.makedirs(output_dir, exist_ok=True)
    except OSError as failure:
        print(f"convert_on_dask: cannot create {output_dir}: {failure.strerror}", file=sys.stderr)
        return 1

    start = time.monotonic()
    results, workers = run(jobs, args) if jobs else ([], 0)
    seconds = time.monotonic() - start

    fallbacks = [r for r in results if r[1] == "text"]
    failed = [r for r in results if r[1] == "failed"]
    for source, _, detail, _ in sorted(failed):
        problems.append(f"{source}: {detail}")
    write_summary(summary, fallbacks)
    for problem in problems:
        print(f"convert_on_dask: {problem}", file=sys.stderr)
    print(f"{len(results) - len(failed)} of {len(jobs)} files converted on {workers} worker{'s' * (workers != 1)} "
          f"in {seconds:.1f} s; "
          f"{len(fallbacks)} passed through as text (listed in {summary}); {len(failed)} failed")
    return 1 if problems else 0


if __name__ == "__main__":
    sys.exit(main())
