#!/usr/bin/env bash
# Whole-process latency of `quarncli system version get` beside `date -u`, measured in the same
# run, and quarncli's peak resident memory. Run by hand after a build:
#   bench/latency.sh [BUILD_DIR]
# Targets: at most 1.6x the time of `date -u`; under 6 MiB peak memory.
set -euo pipefail
source "$(dirname "${BASH_SOURCE[0]}")/common.sh" "${1:-}"
export QUARN_HOST_STATE="$work/host"
"$cli" system version get >/dev/null   # first use creates the host; not part of the measure

out="$(mktemp)"
hyperfine -N --warmup 50 --runs 1000 --export-json "$out" \
  'date -u' "$cli system version get" >/dev/null
read -r date_ms cli_ms < <(python3 - "$out" <<'PY'
import json, sys
r = json.load(open(sys.argv[1]))["results"]
print(" ".join(f"{x['median'] * 1000:.3f}" for x in r))
PY
)
rm -f "$out"
rss_kib="$(/usr/bin/time -f %M "$cli" system version get 2>&1 >/dev/null | tail -1)"
awk -v d="$date_ms" -v c="$cli_ms" -v r="$rss_kib" 'BEGIN {
  printf "date -u                    median %.3f ms\n", d
  printf "quarncli system version get median %.3f ms  (%.2fx date -u; target <= 1.6x)\n", c, c / d
  printf "quarncli peak RSS          %.2f MiB (target < 6 MiB)\n", r / 1024 }'
