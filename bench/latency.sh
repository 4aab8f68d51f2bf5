#!/usr/bin/env bash
# Whole-process latency of `quarncli system version get` beside `date -u`, and quarncli's peak
# resident memory. Run by hand after a build:
#   bench/latency.sh [BUILD_DIR] [ROUNDS]
# The two commands are measured side by side in ROUNDS (default 5) rounds of hyperfine, 200 runs
# each after warm-up: this machine's speed drifts within seconds, and a single long run of one
# command after the other moved the ratio between 1.6x and 2.3x. The ratio reported is the median
# of the rounds' ratios of medians.
# Beside them runs bench_startup_floor: the C++ runtime carried and exported, an empty plug-in
# opened and one value read with SQLite, as a reference for what any process of quarncli's shape
# costs here before its own work.
# Targets: at most 1.6x the time of `date -u`; under 6 MiB peak memory.
set -euo pipefail
source "$(dirname "${BASH_SOURCE[0]}")/common.sh" "${1:-}"
rounds="${2:-5}"
export QUARN_HOST_STATE="$work/host"
"$cli" system version get >/dev/null   # first use creates the host; not part of the measure
commands=('date -u' "$cli system version get")
if [ -x "$build/bin/bench_startup_floor" ]; then   # built with the benchmarks (QUARN_BENCH)
  commands+=("$build/bin/bench_startup_floor $work/host/host.db $build/lib/libbench_empty_plugin.so")
fi

for round in $(seq "$rounds"); do
  hyperfine -N --warmup 20 --runs 200 --export-json "$work/round$round.json" "${commands[@]}" \
    >/dev/null 2>&1
done
rss_kib="$(/usr/bin/time -f %M "$cli" system version get 2>&1 >/dev/null | tail -1)"
python3 - "$rss_kib" "$work"/round*.json <<'PY'
import json, statistics, sys
rounds = [[r["median"] * 1000 for r in json.load(open(f))["results"]] for f in sys.argv[2:]]
for i, r in enumerate(rounds, 1):
    line = f"round {i}: date -u {r[0]:.3f} ms, quarncli {r[1]:.3f} ms ({r[1] / r[0]:.2f}x)"
    if len(r) > 2:
        line += f", floor {r[2]:.3f} ms ({r[2] / r[0]:.2f}x)"
    print(line)
def median(k):
    return statistics.median(r[k] for r in rounds), statistics.median(r[k] / r[0] for r in rounds)
print(f"date -u                     median {median(0)[0]:.3f} ms")
print("quarncli system version get median %.3f ms  (%.2fx date -u; target <= 1.6x)" % median(1))
if len(rounds[0]) > 2:
    print("bench_startup_floor         median %.3f ms  (%.2fx date -u)" % median(2))
print(f"quarncli peak RSS           {int(sys.argv[1]) / 1024:.2f} MiB (target < 6 MiB)")
PY
