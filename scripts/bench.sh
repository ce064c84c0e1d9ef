#!/usr/bin/env bash
# Times the tsd tool on generated designs and prints one table anyone can
# compare with their own run: for the realistic mix at two scales, `tsd
# check`, `tsd fmt` and `tsd trim --remove <50 elements>` with their MB/s,
# peak memory per property and t(10N)/t(N); then check and trim of the
# adversarial shapes at one size.
#
#   scripts/bench.sh                      # defaults below
#   SCALES="80000 800000" SHAPE_N=30000 SHAPE_TIMEOUT=300 scripts/bench.sh
#
#   SCALES   two mix sizes in properties, the second ten times the first
#            (default "80000 800000")
#   SHAPE_N  the length or width of the adversarial shapes (default 1000000)
#   TIMEOUT  seconds before a run of the mix is given up and shown as such
#            (default 600)
#   SHAPE_TIMEOUT  the same for the adversarial shapes (default 120), for
#            each run
#   SEED     the generator's seed (default 1)
#   RUNS     timed runs of each command, after one warm-up; the table shows
#            the run with the median wall clock (default 3)
#   WORK     where the inputs go (default build/bench-data)
#
# The tool and the generator are built optimised in build/release. Wall
# clock times are what the table's MB/s and t(10N)/t(N) use; on a busy
# machine (the load average is printed) the cpu column and the ratio in
# parentheses, from user plus system time, are the steadier figures.
set -euo pipefail
cd "$(dirname "$0")/.."

read -r -a scales <<<"${SCALES:-80000 800000}"
shape_n=${SHAPE_N:-1000000}
mix_timeout=${TIMEOUT:-600}
shape_timeout=${SHAPE_TIMEOUT:-120}
seed=${SEED:-1}
runs_n=${RUNS:-3}
work=${WORK:-build/bench-data}

bash scripts/setup-deps.sh
cmake -S . -B build/release -G Ninja -DCMAKE_BUILD_TYPE=Release -DTSD_BUILD_TESTS=OFF \
    -DTSD_BUILD_EXAMPLES=OFF -DTSD_BUILD_BENCH=ON >/dev/null
cmake --build build/release --target tsd_cli tsd_gen >/dev/null
tsd=build/release/tools/tsd
gen=build/release/bench/gen/tsd_gen
mkdir -p "$work"

echo "machine: $(nproc) cores, $(awk '/MemTotal/ {printf "%.1f GiB", $2 / 1048576}' /proc/meminfo)," \
    "$(grep -m1 'model name' /proc/cpuinfo | cut -d: -f2 | sed 's/^ *//')"
echo "tool: $tsd ($(git rev-parse --short HEAD 2>/dev/null || echo 'no git'))"
echo "load average at the start: $(cut -d' ' -f1-3 /proc/loadavg)"
echo

# Runs one command under /usr/bin/time, once to warm up and then RUNS
# times; sets `secs` (wall clock), `cpu` (user and system seconds: on a busy
# machine the steadier figure) and `rss_kb` of the run with the median wall
# clock, or secs=timeout when a run did not finish in time. Fails on any
# other error. The warm-up is not counted: on a virtual machine, the first
# touch of memory that another program (the generator) just gave back can
# cost the next program more than its own work.
measure() {
    local log="$work/time.log"
    echo "\$ $*"
    local runs=() run status
    for ((run = 0; run <= runs_n; run++)); do
        status=0
        timeout "$timeout_s" /usr/bin/time -v -o "$log" "$@" >/dev/null 2>"$work/stderr.log" ||
            status=$?
        if [ "$status" -eq 124 ]; then
            secs=timeout
            cpu=-
            rss_kb=-
            return
        fi
        if [ "$status" -ne 0 ]; then
            echo "bench: the command failed ($status):" >&2
            head -5 "$work/stderr.log" >&2
            exit 1
        fi
        [ "$run" -eq 0 ] && continue
        runs+=("$(awk -F': ' '
            /Elapsed \(wall clock\)/ {
                n = split($2, p, ":"); s = 0; for (i = 1; i <= n; i++) s = s * 60 + p[i] }
            /User time|System time/ { c += $2 }
            /Maximum resident set size/ { r = $2 }
            END { printf "%s %.2f %s", s, c, r }' "$log")")
    done
    read -r secs cpu rss_kb < <(printf '%s\n' "${runs[@]}" | sort -n -k1,1 |
        sed -n "$(((runs_n + 1) / 2))p")
}

row() { printf '%-16s %9s %7s %-10s %9s %9s %9s %11s %13s\n' "$@"; }

# Prints a table of measurements "label|props|bytes|command|secs|cpu|rss_kb|ratio".
table() {
    echo
    row "$1" "props" "MB" "command" "seconds" "cpu s" "MB/s" "RSS B/prop" "t(10N)/t(N)"
    shift
    local r label props bytes cmd secs cpu rss_kb ratio mb rate per
    for r in "$@"; do
        IFS='|' read -r label props bytes cmd secs cpu rss_kb ratio <<<"$r"
        mb=$(awk -v b="$bytes" 'BEGIN {printf "%.1f", b / 1e6}')
        if [ "$secs" = timeout ]; then
            row "$label" "$props" "$mb" "$cmd" ">$timeout_s" - - - -
            continue
        fi
        rate=$(awk -v b="$bytes" -v s="$secs" 'BEGIN {printf "%.1f", (s > 0 ? b / 1e6 / s : 0)}')
        per=$(awk -v k="$rss_kb" -v p="$props" 'BEGIN {printf "%.0f", k * 1024 / p}')
        row "$label" "$props" "$mb" "$cmd" "$secs" "$cpu" "$rate" "$per" "$ratio"
    done
}

timeout_s=$mix_timeout
echo "== realistic mix (seed $seed)"
declare -A time_of cpu_of
results=()
for n in "${scales[@]}"; do
    input="$work/mix-$n.props"
    "$gen" mix "$n" --seed "$seed" -o "$input"
    mapfile -t removed < <("$gen" mix "$n" --seed "$seed" --remove-list 50)
    bytes=$(stat -c %s "$input")
    props=$(grep -cv '^#' "$input")
    for cmd in check fmt trim; do
        case $cmd in
        check) measure "$tsd" check "$input" ;;
        fmt) measure "$tsd" fmt "$input" ;;
        trim) measure "$tsd" trim "$input" --remove "${removed[@]}" ;;
        esac
        time_of[$cmd-$n]=$secs
        cpu_of[$cmd-$n]=$cpu
        ratio=-
        small=${time_of[$cmd-${scales[0]}]}
        if [ "$n" = "${scales[1]:-}" ] && [ "$small" != timeout ] && [ "$secs" != timeout ]; then
            ratio=$(awk -v a="$secs" -v b="$small" -v c="$cpu" -v d="${cpu_of[$cmd-${scales[0]}]}" \
                'BEGIN {printf "%.1f (%.1f)", (b > 0 ? a / b : 0), (d > 0 ? c / d : 0)}')
        fi
        results+=("mix-$n|$props|$bytes|$cmd|$secs|$cpu|$rss_kb|$ratio")
    done
done
table "case" "${results[@]}"

timeout_s=$shape_timeout
echo
echo "== adversarial shapes at $shape_n (timeout ${timeout_s}s)"
results=()
for shape in group-chain group-chain-rev tsid-chain tsid-chain-rev wide-group tnm-refs trashed; do
    input="$work/$shape-$shape_n.props"
    "$gen" "$shape" "$shape_n" -o "$input"
    bytes=$(stat -c %s "$input")
    props=$(grep -cv '^#' "$input")
    measure "$tsd" check "$input"
    results+=("$shape|$props|$bytes|check|$secs|$cpu|$rss_kb|-")
    # Withdrawing the base cascades through a chain; the other two shapes
    # list every element, too many for one command line.
    case $shape in
    tnm-refs | trashed) measure "$tsd" fmt "$input" && cmd=fmt ;;
    *) measure "$tsd" trim "$input" --remove base && cmd="trim base" ;;
    esac
    results+=("$shape|$props|$bytes|$cmd|$secs|$cpu|$rss_kb|-")
done
table "shape" "${results[@]}"
