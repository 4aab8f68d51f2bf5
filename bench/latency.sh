#!/usr/bin/env bash
# Whole-process latency of `quarncli system version get` beside `date -u`, and quarncli's peak
# resident memory. Run by hand after a build:
#   bench/latency.sh [BUILD_DIR] [ROUNDS]
# The two commands are measured side by side in ROUNDS (default 5) rounds of hyperfine, 200 runs
# each after warm-up: this machine's speed drifts within seconds, and a single long run of one
# command after the other moved the ratio between 1.6x and 2.3x. The ratio reported is the median
# of the rounds' ratios of medians.
# Targets: at most 1.6x the time of `date -u`; under 6 MiB peak memory.
set -euo pipefail
source "$(dirname "${BASH_SOURCE[0]}")/common.sh" "${1:-}"
rounds="${2:-5}"
export QUARN_HOST_STATE="$work/host"
"$cli" system version get >/dev/null   # first use creates the host; not part of the measure

for round in $(seq "$rounds"); do
  hyperfine -N --warmup 20 --runs 200 --export-json "$work/round$round.json" \
    'date -u' "$cli system version get" >/dev/null 2>&1
done
rss_kib="$(/usr/bin/time -f %M "$cli" system version get 2>&1 >/dev/null | tail -1)"
python3 - "$rss_kib" "$work"/round*.json <<'PY'
import json, statistics, sys
rounds = [[r["median"] * 1000 for r in json.load(open(f))["results"]] for f in sys.argv[2:]]
for i, (d, c) in enumerate(rounds, 1):
    print(f"round {i}: date -u {d:.3f} ms, quarncli {c:.3f} ms ({c / d:.2f}x)")
date = statistics.median(d for d, _ in rounds)
cli = statistics.median(c for _, c in rounds)
ratio = statistics.median(c / d for d, c in rounds)
print(f"date -u                     median {date:.3f} ms")
print(f"quarncli system version get median {cli:.3f} ms  ({ratio:.2f}x date -u; target <= 1.6x)")
print(f"quarncli peak RSS           {int(sys.argv[1]) / 1024:.2f} MiB (target < 6 MiB)")
PY
