#!/usr/bin/env python3
"""Converts material libraries (.zelmat) and render-options files (.zelopt) to XML
on a Dask cluster, through the Python module Dexmor.

    convert_on_dask.py -o OUT FOLDER_OR_FILE...                          # a local cluster
    convert_on_dask.py -o OUT --scheduler tcp://HOST:8786 FOLDER_OR_FILE...
    convert_on_dask.py -o OUT --scheduler tcp://HOST:8786 --send-bytes FOLDER_OR_FILE...

Each argument is a file, or a folder whose .zelmat and .zelopt files (directly in
it, any letter case) are all converted. Every file gives OUT/<file name>.xml, the
same text that `dexmor xml -o OUT` writes and that Dexmor.getZelmatXml /
getZeloptXml return. OUT/text-fallbacks.tsv lists the files that did not read as
binary and were passed through as text, each with the reason that
Dexmor.diagnose gives. A file that cannot be opened, or whose document would
exceed the output budget, gets no output and is reported.

Every file is read once: Dexmor.convertWithDiagnosis gives its text and the
reason it did not read as binary (or None) from one reading.

Without --scheduler the script starts a cluster of worker processes on this
machine (--workers, default: the number of processors). With it, it connects to
a running cluster. The workers need the module Dexmor installed; this machine
does not. By default the workers read the inputs and write the outputs
themselves, so every path must name the same file on every worker (a shared
file system). With --send-bytes this machine reads each file and sends its bytes
to a worker, which converts them with Dexmor.convertBytesWithDiagnosis and sends
the document back to be written here: the workers need no access to the files.
Each worker runs one conversion at a time per thread; the module releases the
interpreter lock, so --threads above 1 also runs in parallel.

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


def failure_text(failure):
    return f"{type(failure).__name__}: {failure}"


def converted(source, data=None):
    """Converts one file: the file at `source`, read here once, or `data`, its bytes
    read elsewhere. Returns (outcome, detail, document): outcome "xml", or "text"
    when the file did not read as binary and passed through as its own text (detail
    is the reason), with the document's UTF-8 bytes; or "failed" (detail says why:
    the file cannot be opened, the document is over its budget) and None."""
    import Dexmor

    kind = "zelmat" if source.lower().endswith(".zelmat") else "zelopt"
    try:
        if data is None:
            xml, reason = Dexmor.convertWithDiagnosis(source, kind=kind)
        else:
            xml, reason = Dexmor.convertBytesWithDiagnosis(data, kind)
    except (Dexmor.error, OSError, ValueError, TypeError, MemoryError) as failure:
        return "failed", failure_text(failure), None
    return ("xml" if reason is None else "text"), reason, xml.encode("utf-8")


def store(source, target, outcome, detail, document):
    """Writes a converted document to its target; returns (source, outcome, detail,
    bytes written)."""
    if outcome == "failed":
        return source, outcome, detail, 0
    try:
        write_atomically(target, document)
    except OSError as failure:
        return source, "failed", f"cannot write {target}: {failure.strerror or failure}", 0
    return source, outcome, detail, len(document)


def convert_one(source, target):
    """Converts one file and writes its document; returns (source, outcome, detail,
    bytes written), where outcome is "xml", "text" (passed through; detail is the
    reason) or "failed"."""
    return store(source, target, *converted(source))


def convert_batch(jobs):
    """A task: converts each (source, target) pair of the batch."""
    return [convert_one(source, target) for source, target in jobs]


def convert_sent_batch(files):
    """A task: converts each (source, bytes) pair of the batch; returns (source,
    outcome, detail, document) for the client to write."""
    return [(source, *converted(source, data)) for source, data in files]


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


def read_files(jobs):
    """The bytes of each job's file, read here once, as (source, bytes) pairs; and
    the results of the files that cannot be read."""
    files, failed = [], []
    for source, _ in jobs:
        try:
            with open(source, "rb") as file:
                files.append((source, file.read()))
        except OSError as failure:
            failed.append((source, "failed", failure_text(failure), 0))
    return files, failed


def run(jobs, args):
    """Converts every job on the cluster; one result per job, in any order."""
    from distributed import as_completed

    client, cluster = connect(args)
    try:
        targets = dict(jobs)
        batches = iter([jobs[i: i + args.batch_size] for i in range(0, len(jobs), args.batch_size)])
        # A batch of paths is small: all of them go at once. A batch of bytes holds
        # its files, and then their documents, in this process's memory: only a
        # couple for each thread of the cluster are under way at a time.
        in_flight = max(2 * sum(client.nthreads().values()), 2) if args.send_bytes else len(targets)
        results, futures, running = [], {}, as_completed()

        def submit_next():
            for batch in batches:
                if args.send_bytes:
                    files, unread = read_files(batch)
                    results.extend(unread)
                    if not files:
                        continue
                    future = client.submit(convert_sent_batch, files, pure=False)
                    futures[future] = [source for source, _ in files]
                else:
                    future = client.submit(convert_batch, batch, pure=False)
                    futures[future] = [source for source, _ in batch]
                running.add(future)
                return

        for _ in range(in_flight):
            submit_next()
        for future in running:
            sources = futures.pop(future)
            if future.status != "finished":  # the task itself failed: a worker died, or the module is missing there
                failure = failure_text(future.exception())
                results.extend((source, "failed", failure, 0) for source in sources)
            elif args.send_bytes:
                results.extend(store(source, targets[source], *outcome) for source, *outcome in future.result())
            else:
                results.extend(future.result())
            del future  # with its result: a batch of documents is let go of before the next one comes
            submit_next()
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
    parser.add_argument("--send-bytes", action="store_true",
                        help="read the files here and send their bytes to the workers, which send back the "
                             "documents to be written here: no shared file system is needed")
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
