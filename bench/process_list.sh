#!/usr/bin/env bash
# `quarncli system process list` on the default host and on generated hosts of 1k, 10k and 100k
# worlds, beside `ps -e` on this machine, measured in the same run: the median time of each
# (hyperfine), the cost per world over a host without worlds, and quarncli's peak resident
# memory. Run by hand after a build:
#   bench/process_list.sh [BUILD_DIR]
# Target: the cost per world stays flat (within 25%) from 1k to 100k worlds.
set -euo pipefail
source "$(dirname "${BASH_SOURCE[0]}")/common.sh" "${1:-}" procps:ps

# The hosts: the default one, one without worlds (the fixed cost) and the generated ones.
"$host" --state "$work/default" init >/dev/null
echo '{"format": 1, "worlds": []}' | "$host" --state "$work/0" init --scenario - >/dev/null
for n in 1000 10000 100000; do
  python3 "$root/bench/worlds.py" "$n" | "$host" --state "$work/$n" init --scenario - >/dev/null
done

median_ms() {  # runs, command...
  local runs="$1"; shift
  hyperfine -N --warmup 2 --runs "$runs" --export-json "$work/r.json" "$*" >/dev/null 2>&1
  python3 -c 'import json,sys; print("%.3f" % (json.load(open(sys.argv[1]))["results"][0]["median"] * 1000))' "$work/r.json"
}
rss_kib() { /usr/bin/time -f %M "$@" 2>&1 >/dev/null | tail -1; }

ps_ms="$(median_ms 50 ps -e)"
ps_rows="$(ps -e | tail -n +2 | wc -l)"
printf '%-22s %10s %14s %12s %14s\n' "host" "median ms" "us per world" "peak MiB" "KiB per world"
printf '%-22s %10s %14s %12s %14s\n' "ps -e ($ps_rows processes)" "$ps_ms" \
  "$(awk -v t="$ps_ms" -v n="$ps_rows" 'BEGIN { printf "%.2f", t * 1000 / n }')" "-" "-"
base_ms="$(median_ms 30 "$cli" --host-state "$work/0" system process list)"
base_kib="$(rss_kib "$cli" --host-state "$work/0" system process list)"
printf '%-22s %10s %14s %12.2f %14s\n' "no worlds" "$base_ms" "-" "$(awk -v k="$base_kib" 'BEGIN { print k / 1024 }')" "-"
default_worlds="$("$cli" --host-state "$work/default" --formatter json system process list | python3 -c 'import json,sys; print(len(json.load(sys.stdin)))')"
for spec in "default:$default_worlds:30" "1000:1000:20" "10000:10000:10" "100000:100000:5"; do
  IFS=: read -r name n runs <<<"$spec"
  ms="$(median_ms "$runs" "$cli" --host-state "$work/$name" system process list)"
  kib="$(rss_kib "$cli" --host-state "$work/$name" system process list)"
  awk -v name="$name ($n worlds)" -v ms="$ms" -v b="$base_ms" -v n="$n" -v k="$kib" -v bk="$base_kib" 'BEGIN {
    printf "%-22s %10.3f %14.2f %12.2f %14.2f\n", name, ms, (ms - b) * 1000 / n, k / 1024, (k - bk) / n }'
done
