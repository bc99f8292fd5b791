#!/usr/bin/env bash
# Times Dexmor on large material libraries and a folder of many small files, and
# prints a table with the ratios that still compare like with like on a busy
# machine. See bench/README.md for what each row means.
#
#   bench/run.sh
#
# Environment (all optional):
#   DEXMOR_BENCH_DIR    where the generated files live (default /tmp/dexmor-bench);
#                       they are made once and reused while DIR/complete matches
#   DEXMOR_BENCH_SCRATCH  where the script's own folder dexmor-bench-out goes, for the
#                       produced XML and the raw results (default /dev/shm when it
#                       exists, so that disk speed stays out of the figures)
#   DEXMOR_BUILD_DIR    the optimised build to use (default build/release, made with
#                       the "release" preset); another folder is configured as Release
#   DEXMOR_BENCH_NO_BUILD=1   use the build as it stands
#   DEXMOR_BENCH_LIBRARIES    material counts of the libraries (default "1000 10000 100000")
#   DEXMOR_BENCH_FILES        number of small files (default 5000)
#   DEXMOR_BENCH_RUNS         runs per measurement (default 5; 3 for the largest
#                             library, 1 for xmllint on it)
#   PYTHON              the interpreter the module is built for (default /usr/bin/python3)
set -euo pipefail

root=$(cd "$(dirname "$0")/.." && pwd)
build=${DEXMOR_BUILD_DIR:-$root/build/release}
data=${DEXMOR_BENCH_DIR:-/tmp/dexmor-bench}
libraries=(${DEXMOR_BENCH_LIBRARIES:-1000 10000 100000})
files=${DEXMOR_BENCH_FILES:-5000}
runs=${DEXMOR_BENCH_RUNS:-5}
python=${PYTHON:-/usr/bin/python3}
helper=$root/bench/stats.py
if [[ -n ${DEXMOR_BENCH_SCRATCH:-} ]]; then
    out=$DEXMOR_BENCH_SCRATCH/dexmor-bench-out
elif [[ -d /dev/shm && -w /dev/shm ]]; then
    out=/dev/shm/dexmor-bench-out
else
    out=$data/dexmor-bench-out
fi

say() { printf '%s\n' "$*" >&2; }

# --- tools -------------------------------------------------------------------
if [[ ! -x /usr/bin/time ]] || ! command -v xmllint >/dev/null || ! command -v cmake >/dev/null; then
    say "installing the missing tools (tools/dev deps)"
    "$root/tools/dev" deps
fi

# --- build -------------------------------------------------------------------
targets=(dexmor Dexmor dexmor_make_bench_files dexmor_bench)
if [[ -z ${DEXMOR_BENCH_NO_BUILD:-} ]]; then
    say "building ${targets[*]} in $build"
    if [[ $build == "$root/build/release" ]]; then
        (cd "$root" && cmake --preset release >/dev/null &&
            cmake --build --preset release --target "${targets[@]}" >/dev/null)
    else
        cmake -S "$root" -B "$build" -G Ninja -DCMAKE_BUILD_TYPE=Release -DDEXMOR_BUILD_BENCH=ON >/dev/null
        cmake --build "$build" --target "${targets[@]}" >/dev/null
    fi
fi
dexmor=$build/cli/dexmor
export PYTHONPATH=$build/python${PYTHONPATH:+:$PYTHONPATH}
export PYTHONDONTWRITEBYTECODE=1

# --- files -------------------------------------------------------------------
manifest=$(printf 'libraries %s\nfiles %s' "${libraries[*]}" "$files")
if [[ ! -f $data/complete || $(<"$data/complete") != "$manifest" ]]; then
    say "generating the files in $data"
    list=${libraries[*]}
    "$build/bench/make_bench_files" --libraries "${list// /,}" --files "$files" "$data" >&2
fi
shopt -s nullglob
folder=("$data"/files/*.zelmat "$data"/files/*.zelopt)
options_files=("$data"/files/*.zelopt)
shopt -u nullglob

rm -rf "$out"
mkdir -p "$out"
results=$out/results.tsv
: >"$results"
record() { # NAME KEY VALUE...
    local IFS=' '
    printf '%s\t%s\t%s\n' "$1" "$2" "${*:3}" >>"$results"
}

# Processor time from perf's task clock (microseconds) when perf can count it;
# otherwise from /usr/bin/time, which rounds to 10 ms.
cpu_clock=()
if perf stat -x, -e task-clock true >/dev/null 2>&1; then
    cpu_clock=(perf stat -x, -e task-clock -o "$out/cpu.log" --)
fi

# measure NAME RUNS COMMAND...: runs COMMAND (standard output to /dev/null) under
# /usr/bin/time -v; records the wall time, the processor time and the peak
# resident memory of each run.
measure() {
    local name=$1 count=$2
    shift 2
    local times=() cpus=() rss=() log=$out/time.log start end status r
    for ((r = 0; r < count; r++)); do
        start=$EPOCHREALTIME
        status=0
        "${cpu_clock[@]}" /usr/bin/time -v -o "$log" "$@" >/dev/null 2>>"$out/stderr.log" || status=$?
        end=$EPOCHREALTIME
        if ((status != 0)); then
            say "  $name: exit status $status (see $out/stderr.log)"
            record "$name" failed "$status"
            return 0
        fi
        times+=("$(awk -v a="$start" -v b="$end" 'BEGIN { printf "%.6f", b - a }')")
        if ((${#cpu_clock[@]})); then
            cpus+=("$(awk -F, '/task-clock/ { printf "%.6f", $1 / 1000 }' "$out/cpu.log")")
        else
            cpus+=("$(awk -F': ' '/User time|System time/ { s += $2 } END { printf "%.3f", s }' "$log")")
        fi
        rss+=("$(awk -F': ' '/Maximum resident set size/ { print $2 }' "$log")")
    done
    record "$name" seconds "${times[@]}"
    record "$name" cpu_seconds "${cpus[@]}"
    record "$name" rss_kb "${rss[@]}"
    say "  $name: ${times[*]} s"
}

# startup NAME RUNS COMMAND...: wall times only, without the /usr/bin/time wrapper.
startup() {
    local name=$1 count=$2 times=() start end r
    shift 2
    "$@" >/dev/null # warm the caches
    for ((r = 0; r < count; r++)); do
        start=$EPOCHREALTIME
        "$@" >/dev/null
        end=$EPOCHREALTIME
        times+=("$(awk -v a="$start" -v b="$end" 'BEGIN { printf "%.6f", b - a }')")
    done
    record "$name" seconds "${times[@]}"
    # The processor time, which a busy machine does not stretch, when perf can count it.
    if perf stat -x, -e task-clock true >/dev/null 2>&1; then
        local ms
        ms=$(perf stat -x, -e task-clock -r "$count" "$@" 2>&1 >/dev/null | awk -F, '/task-clock/ { print $1 }')
        [[ -n $ms ]] && record "$name" cpu_seconds "$(awk -v m="$ms" 'BEGIN { printf "%.6f", m / 1000 }')"
    fi
}

size_of() { stat -c %s "$1"; }
mem_available_kb() { awk '/MemAvailable/ { print $2 }' /proc/meminfo; }

record machine uptime_before "$(uptime)"
record machine cores "$(nproc)"
record machine dexmor_version "$("$dexmor" --version)"
say "load before: $(uptime)"

# --- the libraries -----------------------------------------------------------
largest=${libraries[-1]}
for count in "${libraries[@]}"; do
    library=$data/library-$count.zelmat
    xml=$out/library-$count.xml
    n=$runs
    ((count == largest && ${#libraries[@]} > 1 && runs > 3)) && n=3
    say "library of $count materials"
    "$dexmor" xml "$library" >"$xml"
    record "library-$count" materials "$count"
    record "library-$count" input_bytes "$(size_of "$library")"
    record "library-$count" xml_bytes "$(size_of "$xml")"

    measure "dexmor xml/library-$count" "$n" "$dexmor" xml "$library"
    measure "cat/library-$count" "$n" cat "$xml"
    # A material document holds one <Assets> block per material; a parser wants
    # one root, so xmllint reads the same text inside one more element.
    wrapped=$out/library-$count.wrapped.xml
    { printf '<Library>\n'; cat "$xml"; printf '</Library>\n'; } >"$wrapped"
    # xmllint holds the whole tree: about nine times the text.
    need_kb=$(($(size_of "$wrapped") * 9 / 1024))
    if ((need_kb * 3 / 2 < $(mem_available_kb))); then
        m=$n
        ((count == largest && ${#libraries[@]} > 1)) && m=1
        ((count != largest && m > 3)) && m=3
        measure "xmllint --format/library-$count" "$m" xmllint --format "$wrapped"
    else
        say "  xmllint skipped: it needs about $((need_kb / 1024 / 1024)) GB"
        record "xmllint --format/library-$count" skipped "needs about $((need_kb / 1024 / 1024)) GB of memory"
    fi
    rm -f "$wrapped"
    rm -f "$out/python-call.txt"
    measure "python getZelmatXml/library-$count" "$n" "$python" "$helper" call "$library" "$out/python-call.txt"
    record "python getZelmatXml/library-$count" call_seconds $(awk '{ print $1 }' "$out/python-call.txt")
    record "python getZelmatXml/library-$count" call_cpu_seconds $(awk '{ print $2 }' "$out/python-call.txt")
    rm -f "$xml"
done
measure "python import Dexmor (peak memory)" 1 "$python" -c "import Dexmor"

# --- the folder of small files -----------------------------------------------
say "folder of ${#folder[@]} files"
folder_input=$(cat "${folder[@]}" | wc -c)
record folder files "${#folder[@]}"
record folder input_bytes "$folder_input"

# One conversion of everything, for the size of the XML and to warm the caches.
mkdir -p "$out/folder-reference"
"$dexmor" xml -o "$out/folder-reference" "${folder[@]}" >/dev/null
record folder xml_bytes "$(cat "$out"/folder-reference/* | wc -c)"
jobs_supported=
mkdir -p "$out/probe"
"$dexmor" xml -j 1 -o "$out/probe" "${folder[0]}" >/dev/null 2>&1 && jobs_supported=1
rm -rf "$out/probe"

if [[ -n $jobs_supported ]]; then
    folder_runs=3
    same=yes
    for ((r = 0; r < folder_runs; r++)); do
        for j in 1 2; do
            rm -rf "$out/folder-j$j"
            mkdir -p "$out/folder-j$j"
            measure "dexmor xml -o DIR -j $j/folder" 1 "$dexmor" xml -o "$out/folder-j$j" -j "$j" "${folder[@]}"
        done
        diff -rq "$out/folder-j1" "$out/folder-j2" >/dev/null || same=no
        diff -rq "$out/folder-j1" "$out/folder-reference" >/dev/null || same=no
    done
    record "dexmor xml -o DIR -j 2/folder" identical_to_j1 "$same"
    rm -rf "$out/folder-j1" "$out/folder-j2"
else
    say "  dexmor xml has no -j yet"
    record "dexmor xml -o DIR -j 1/folder" skipped "dexmor xml has no -j option"
    record "dexmor xml -o DIR -j 2/folder" skipped "dexmor xml has no -j option"
fi
rm -rf "$out/folder-reference"

say "  thread pool through the module"
"$python" "$helper" threads "$results" "${folder[@]}"
say "  options files through the module"
"$python" "$helper" options "$results" "${options_files[@]}"

# --- start-up ----------------------------------------------------------------
say "start-up times"
startup "dexmor --version" 20 "$dexmor" --version
startup "python3 -c pass" 20 "$python" -c pass
startup "python3 -c \"import Dexmor\"" 20 "$python" -c "import Dexmor"

# --- micro-benchmarks ----------------------------------------------------------
say "micro-benchmarks"
"$build/bench/dexmor_bench" --benchmark_min_time=0.5 --benchmark_format=json \
    --benchmark_out="$out/micro.json" --benchmark_out_format=json >/dev/null 2>>"$out/stderr.log"
record micro json "$out/micro.json"

record machine uptime_after "$(uptime)"
say "load after: $(uptime)"
"$python" "$helper" report "$results"
say "raw results: $results (python3 bench/stats.py report $results prints this table again)"
