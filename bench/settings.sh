#!/usr/bin/env bash
# The kernel settings lists at scale, run by hand after a build:
#   bench/settings.sh [BUILD_DIR]
# 1. `quarncli system settings advanced list` on the default host (1,345 options) beside
#    `sysctl -a` on this machine, medians of one hyperfine run. Target: at most 0.25x.
# 2. Generated hosts of 1k, 10k and 100k advanced options (100 per branch, two levels) and as
#    many kernel settings: median time and peak resident memory of `advanced list` and
#    `kernel list`, and their cost per row above an empty host's. Target: flat within 25%.
# 3. `advanced list --option` on the 100k host beside the default host. Target: about the same.
set -euo pipefail
source "$(dirname "${BASH_SOURCE[0]}")/common.sh" "${1:-}" python3:python3 procps:sysctl

# A scenario of n advanced options and n kernel settings (n may be 0).
generate() {
  python3 - "$1" <<'PY'
import json, sys
n = int(sys.argv[1])
per = 100
branches, options, settings = [], [], []
groups = max(1, (n + per * 10 - 1) // (per * 10))
for g in range(groups):
    branches.append(f"/Group{g}")
for b in range((n + per - 1) // per):
    branches.append(f"/Group{b % groups}/Unit{b}")
for i in range(n):
    b = i // per
    path = f"/Group{b % groups}/Unit{b}/Option{i}"
    if i % 5 == 4:
        options.append({"path": path, "type": "string", "description": f"Text setting {i} of unit {b}.",
                        "value": "tuned" if i % 7 == 0 else "plain", "default": "plain",
                        "valid_characters": "abcdefghijklmnopqrstuvwxyz"})
    else:
        options.append({"path": path, "type": "integer", "description": f"Counter {i} of unit {b}.",
                        "value": i % 97 if i % 3 else 10, "default": 10, "min": 0, "max": 100000})
    settings.append({"name": f"setting{i}", "type": i % 5, "description": f"Boot setting {i}.",
                     "default": ["x", "TRUE", "16", "1", "2"][i % 5],
                     "configured": ["x", "FALSE", "0x10", "1", "3"][i % 5],
                     "runtime": None if i % 4 == 0 else ["x", "FALSE", "16", "1", "3"][i % 5]})
json.dump({"format": 1, "advanced": {"branches": branches, "options": options},
           "kernel_settings": settings}, sys.stdout)
PY
}

make_host() {  # name size
  generate "$2" > "$work/$1.json"
  "$host" --state "$work/$1" init --scenario "$work/$1.json" >/dev/null
}

median_ms() {  # command...
  local out="$work/hyperfine.json"
  hyperfine -N --warmup "${WARMUP:-3}" --runs "${RUNS:-15}" --export-json "$out" "$@" >/dev/null 2>&1
  python3 - "$out" <<'PY'
import json, sys
print(" ".join(f"{r['median'] * 1000:.3f}" for r in json.load(open(sys.argv[1]))["results"]))
PY
}

peak_kib() { /usr/bin/time -f %M "$@" 2>&1 >/dev/null | tail -1; }

"$host" --state "$work/default" init >/dev/null
echo "== advanced list on the default host beside sysctl -a"
read -r sysctl_ms list_ms < <(RUNS=100 WARMUP=10 median_ms "sysctl -a" \
  "$cli --host-state $work/default system settings advanced list")
awk -v s="$sysctl_ms" -v l="$list_ms" 'BEGIN {
  printf "sysctl -a                          median %8.3f ms\n", s
  printf "quarncli system settings advanced list median %8.3f ms  (%.2fx sysctl -a; target <= 0.25x)\n", l, l / s }'

echo "== lists of generated hosts"
make_host empty 0
for n in 1000 10000 100000; do make_host "h$n" "$n"; done
for command in "advanced list" "kernel list"; do
  read -r base_ms < <(RUNS=40 median_ms "$cli --host-state $work/empty system settings $command")
  base_kib="$(peak_kib "$cli" --host-state "$work/empty" system settings $command)"
  printf "%-14s rows  median ms  peak KiB  us/row above empty  KiB/row above empty\n" "$command"
  for n in 1000 10000 100000; do
    runs=40; [ "$n" = 10000 ] && runs=15; [ "$n" = 100000 ] && runs=5
    read -r ms < <(RUNS=$runs WARMUP=1 median_ms "$cli --host-state $work/h$n system settings $command")
    kib="$(peak_kib "$cli" --host-state "$work/h$n" system settings $command)"
    awk -v n="$n" -v ms="$ms" -v kib="$kib" -v bms="$base_ms" -v bkib="$base_kib" 'BEGIN {
      printf "%-14s %6d  %9.2f  %8d  %18.2f  %19.3f\n", "", n, ms, kib, (ms - bms) * 1000 / n, (kib - bkib) / n }'
  done
done

echo "== one option by path"
read -r small_ms big_ms < <(RUNS=100 WARMUP=10 median_ms \
  "$cli --host-state $work/default system settings advanced list --option /Net/Tcp/MssDefault" \
  "$cli --host-state $work/h100000 system settings advanced list --option /Group55/Unit555/Option55555")
awk -v s="$small_ms" -v b="$big_ms" 'BEGIN {
  printf "--option, default host (1,345 options)  median %.3f ms\n", s
  printf "--option, 100,000 options               median %.3f ms  (%.2fx)\n", b, b / s }'
