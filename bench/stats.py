"""The Python side of bench/run.sh.

  stats.py call LIBRARY OUT          one Dexmor.getZelmatXml call; appends its wall and processor
                                     seconds to OUT
  stats.py threads RESULTS FILE...   thread pools of 1 and 2 threads over the files
  stats.py options RESULTS FILE...   the time of one options-file conversion
  stats.py report RESULTS            the table and the ratios

RESULTS is the tab-separated file run.sh writes: NAME, KEY, then the values
separated by spaces. A NAME and KEY may appear on several lines; their values add up.
"""
import collections
import concurrent.futures
import json
import statistics
import sys
import time

MB = 1e6


def converter(path):
    import Dexmor
    return Dexmor.getZeloptXml if path.lower().endswith(".zelopt") else Dexmor.getZelmatXml


def append(results, name, key, *values):
    with open(results, "a", encoding="utf-8") as out:
        out.write(f"{name}\t{key}\t{' '.join(str(v) for v in values)}\n")


def call(library, out):
    import Dexmor
    start, start_cpu = time.perf_counter(), time.process_time()
    xml = Dexmor.getZelmatXml(library)
    seconds, cpu = time.perf_counter() - start, time.process_time() - start_cpu
    if not xml.startswith("<Assets>"):
        sys.exit(f"{library} did not convert")
    with open(out, "a", encoding="utf-8") as f:
        f.write(f"{seconds:.6f} {cpu:.6f}\n")


def threads(results, paths):
    calls = [(converter(p), p) for p in paths]

    reference = [convert(path) for convert, path in calls]  # also warms the caches

    # Each text is compared with the serial one and dropped, as a pipeline would
    # hand it on: holding the 5,000 texts of every round would time the first
    # touch of fresh memory, which the machine serialises, not the conversions.
    def same_as_serial(index):
        convert, path = calls[index]
        return convert(path) == reference[index]

    def convert_all(workers):
        with concurrent.futures.ThreadPoolExecutor(workers) as pool:
            start, start_cpu = time.perf_counter(), time.process_time()
            same = all(pool.map(same_as_serial, range(len(calls))))
            return time.perf_counter() - start, time.process_time() - start_cpu, same

    times = {1: [], 2: []}
    cpus = {1: [], 2: []}
    identical = True
    for _ in range(3):
        for workers in (1, 2):
            seconds, cpu, same = convert_all(workers)
            times[workers].append(f"{seconds:.6f}")
            cpus[workers].append(f"{cpu:.6f}")
            identical = identical and same
    xml_bytes = sum(len(t.encode("utf-8")) for t in reference)
    for workers in (1, 2):
        append(results, f"python ThreadPoolExecutor({workers})/folder", "seconds", *times[workers])
        append(results, f"python ThreadPoolExecutor({workers})/folder", "cpu_seconds", *cpus[workers])
    append(results, "python ThreadPoolExecutor(2)/folder", "identical_to_1", "yes" if identical else "no")
    append(results, "python ThreadPoolExecutor/folder", "xml_bytes", xml_bytes)


def options(results, paths):
    calls = [(converter(p), p) for p in paths]
    for convert, path in calls:  # warms the caches
        convert(path)
    per_call, per_call_cpu = [], []
    for _ in range(5):
        start, start_cpu = time.perf_counter(), time.process_time()
        for convert, path in calls:
            convert(path)
        per_call.append(f"{(time.perf_counter() - start) / len(calls):.9f}")
        per_call_cpu.append(f"{(time.process_time() - start_cpu) / len(calls):.9f}")
    append(results, "python getZeloptXml (one options file)", "seconds", *per_call)
    append(results, "python getZeloptXml (one options file)", "cpu_seconds", *per_call_cpu)
    append(results, "python getZeloptXml (one options file)", "files", len(calls))


# ---- report ----------------------------------------------------------------------


def load(results):
    table = collections.defaultdict(lambda: collections.defaultdict(list))
    order = []
    with open(results, encoding="utf-8") as f:
        for line in f:
            name, key, values = line.rstrip("\n").split("\t", 2)
            if name not in table:
                order.append(name)
            table[name][key].extend(values.split(" ") if key not in ("uptime_before", "uptime_after", "skipped",
                                                                      "dexmor_version", "json") else [values])
    return table, order


def median(values):
    return statistics.median(float(v) for v in values)


def fmt(value, digits=3):
    if value is None:
        return "n/a"
    if value >= 100:
        return f"{value:.0f}"
    return f"{value:.{digits}g}"


def report(results):
    table, order = load(results)
    machine = table["machine"]
    print()
    print(f"{machine['dexmor_version'][0]} on {machine['cores'][0]} cores")
    print(f"load before: {machine['uptime_before'][0].strip()}")
    print(f"load after:  {machine['uptime_after'][0].strip()}")

    def size_of(name, key):
        base = name.split("/", 1)[1] if "/" in name else name
        for source in (name, base, "python ThreadPoolExecutor/folder" if base == "folder" else None):
            if source and key in table.get(source, {}):
                return float(table[source][key][0])
        return None

    print()
    header = (f"{'measurement':<48} {'runs':>4} {'median s':>10} {'MB/s':>8} {'MB/s cpu':>8} {'peak MB':>8}"
              f" {'peak-in MB':>10}")
    print(header)
    print("-" * len(header))
    medians = {}
    for name in order:
        row = table[name]
        if name in ("machine", "folder", "micro", "python ThreadPoolExecutor/folder") or name.startswith("library-"):
            continue
        if "skipped" in row:
            print(f"{name:<48} {'':>4} {'n/a':>10}  ({row['skipped'][0]})")
            continue
        if "failed" in row:
            print(f"{name:<48} {'':>4} {'failed':>10}  (exit status {row['failed'][0]})")
            continue
        if "seconds" not in row:
            continue
        seconds = median(row["seconds"])
        medians[name] = seconds
        if "cpu_seconds" in row:
            medians[name + " (cpu)"] = median(row["cpu_seconds"])
        xml = size_of(name, "xml_bytes")
        # Memory beyond the input matters for the conversions, not for cat or xmllint.
        source = size_of(name, "input_bytes") if name.startswith(("dexmor xml/", "python getZelmatXml/")) else None
        cpu = median(row["cpu_seconds"]) if "cpu_seconds" in row else None
        rss = max(float(v) for v in row["rss_kb"]) * 1024 if "rss_kb" in row else None
        shown = seconds
        per_file = name.startswith(("python3 ", "dexmor --", "python getZeloptXml"))
        rate = xml / seconds / MB if xml and not per_file else None
        cpu_rate = xml / cpu / MB if xml and cpu and rate else None
        if name.startswith(("python3 ", "dexmor --")):
            shown_text = f"{seconds * 1e3:.2f} ms"
            note = f"  (processor time {cpu * 1e3:.2f} ms)" if cpu else ""
        elif name.startswith("python getZeloptXml"):
            shown_text = f"{seconds * 1e6:.0f} us"
            note = f"  (processor time {cpu * 1e6:.0f} us)" if cpu else ""
        else:
            shown_text = f"{shown:.4g}"
        line = f"{name:<48} {len(row['seconds']):>4} {shown_text:>10} {fmt(rate):>8} {fmt(cpu_rate):>8}"
        line += f" {fmt(rss / MB if rss else None):>8}"
        line += f" {fmt((rss - source) / MB if rss and source else None):>10}"
        print(line + (note if name.startswith(("python getZeloptXml", "python3 ", "dexmor --")) else ""))
        if "call_seconds" in row:
            call = median(row["call_seconds"])
            call_cpu = median(row["call_cpu_seconds"]) if "call_cpu_seconds" in row else None
            medians[name + " (call)"] = call
            print(f"{'  the call alone, inside the interpreter':<48} {len(row['call_seconds']):>4} {call:>10.4g} "
                  f"{fmt(xml / call / MB if xml else None):>8}"
                  f" {fmt(xml / call_cpu / MB if xml and call_cpu else None):>8}")

    print()
    print("Ratios")

    def ratio(label, a, b, unit="x"):
        if a is None or b is None or not b:
            print(f"  {label:<62} n/a")
        else:
            print(f"  {label:<62} {a / b:.3g}{unit}")

    libraries = sorted(int(n.split("-")[1]) for n in order if n.startswith("library-"))
    for count in libraries:
        d = medians.get(f"dexmor xml/library-{count}")
        ratio(f"dexmor xml / cat, time, {count} materials", d, medians.get(f"cat/library-{count}"))
        ratio(f"xmllint --format / dexmor xml, time, {count} materials",
              medians.get(f"xmllint --format/library-{count}"), d)
        ratio(f"getZelmatXml call / dexmor xml, time, {count} materials",
              medians.get(f"python getZelmatXml/library-{count} (call)"), d)
    if len(libraries) > 1:
        small, large = libraries[0], libraries[-1]
        a = medians.get(f"dexmor xml/library-{large}")
        b = medians.get(f"dexmor xml/library-{small}")
        if a and b:
            ratio(f"time per material, {large} / {small} materials", a / large, b / small)
        a = medians.get(f"dexmor xml/library-{large} (cpu)")
        b = medians.get(f"dexmor xml/library-{small} (cpu)")
        if a and b:
            ratio(f"processor time per material, {large} / {small} materials", a / large, b / small)
    ratio("dexmor xml -o DIR: -j 1 / -j 2 (speed-up of 2 jobs)",
          medians.get("dexmor xml -o DIR -j 1/folder"), medians.get("dexmor xml -o DIR -j 2/folder"))
    ratio("dexmor xml -o DIR: processor time of -j 2 / -j 1",
          medians.get("dexmor xml -o DIR -j 2/folder (cpu)"), medians.get("dexmor xml -o DIR -j 1/folder (cpu)"))
    same = table.get("dexmor xml -o DIR -j 2/folder", {}).get("identical_to_j1")
    print(f"  {'-j 2 output identical to -j 1':<62} {same[0] if same else 'n/a'}")
    ratio("ThreadPoolExecutor: 1 thread / 2 threads (speed-up)",
          medians.get("python ThreadPoolExecutor(1)/folder"), medians.get("python ThreadPoolExecutor(2)/folder"))
    ratio("ThreadPoolExecutor: processor time of 2 threads / 1 thread",
          medians.get("python ThreadPoolExecutor(2)/folder (cpu)"),
          medians.get("python ThreadPoolExecutor(1)/folder (cpu)"))
    same = table.get("python ThreadPoolExecutor(2)/folder", {}).get("identical_to_1")
    print(f"  {'2-thread results identical to 1 thread':<62} {same[0] if same else 'n/a'}")
    for suffix, label in (("", "import Dexmor beyond the bare interpreter start"),
                          (" (cpu)", "  the same in processor time")):
        importing = medians.get('python3 -c "import Dexmor"' + suffix)
        bare = medians.get("python3 -c pass" + suffix)
        if importing is not None and bare is not None:
            print(f"  {label:<62} {(importing - bare) * 1e3:.2f} ms")
    base_rss = table.get("python import Dexmor (peak memory)", {}).get("rss_kb")
    for count in libraries:
        name = f"python getZelmatXml/library-{count}"
        if base_rss and "rss_kb" in table.get(name, {}):
            extra = (max(float(v) for v in table[name]["rss_kb"]) - float(base_rss[0])) * 1024
            held = size_of(name, "input_bytes") + 2 * size_of(name, "xml_bytes")
            print(f"  {f'getZelmatXml memory beyond the interpreter, {count} materials':<62} {extra / MB:.0f} MB "
                  f"(input + 2 x XML = {held / MB:.0f} MB)")

    micro = table.get("micro", {}).get("json")
    if micro:
        try:
            with open(micro[0], encoding="utf-8") as f:
                benchmarks = json.load(f)["benchmarks"]
        except (OSError, ValueError, KeyError):
            benchmarks = []
        if benchmarks:
            print()
            print("Micro-benchmarks (dexmor_bench; processor time per iteration, and bytes per processor second)")
            for b in benchmarks:
                rate = b.get("bytes_per_second")
                print(f"  {b['name']:<34} {b['cpu_time']:>10.3f} {b['time_unit']:<3}"
                      f" {(f'{rate / MB:.0f} MB/s') if rate else '':>12}")
            # The streamed conversion in one process: the time per material without
            # the start of a process in it.
            # Named arguments: BM_StreamLibrary/materials:N/budget:1 (the budget checked).
            per_material = {}
            for b in benchmarks:
                args = dict(part.split(":", 1) for part in b["name"].split("/")[1:] if ":" in part)
                if (b["name"].startswith("BM_StreamLibrary/") and "per_material" in b
                        and args.get("budget", "1") == "1"):
                    per_material[int(args["materials"])] = b["per_material"]
            if len(per_material) > 1:
                small, large = min(per_material), max(per_material)
                print(f"  {f'BM_StreamLibrary time per material, {large} / {small} materials':<62} "
                      f"{per_material[large] / per_material[small]:.3g}x "
                      f"({per_material[small] * 1e6:.1f} and {per_material[large] * 1e6:.1f} us)")


def main(argv):
    command = argv[1] if len(argv) > 1 else ""
    if command == "call" and len(argv) == 4:
        call(argv[2], argv[3])
    elif command == "threads" and len(argv) > 3:
        threads(argv[2], argv[3:])
    elif command == "options" and len(argv) > 3:
        options(argv[2], argv[3:])
    elif command == "report" and len(argv) == 3:
        report(argv[2])
    else:
        sys.exit(__doc__)


if __name__ == "__main__":
    main(sys.argv)
