#!/usr/bin/env bash
# The cost per row of `system mirafs ramdisk list` and `system mirafs tardisk list` on generated
# hosts of 1,000, 10,000 and 100,000 ramdisks and tardisks (each ramdisk with a directory and one
# file under root/, so that its usage is walked), and quarncli's peak resident memory. Run by
# hand after a build:
#   bench/memfs_lists.sh [BUILD_DIR] [SIZES...]
# Target: the time per row flat within 25% from 1k to 100k rows. A command is run 100,000/rows
# times in a row (at least once) so that every size is timed over about the same work; each
# figure is the median of three such runs, per command: wall seconds, and CPU seconds (user +
# system, steadier on a busy machine). The cost per row is the CPU time above that of a host
# without rows, divided by the rows. Hosts are made (quarnhost init) before and outside the
# measure.
set -euo pipefail
source "$(dirname "${BASH_SOURCE[0]}")/common.sh" "${1:-}"
shift || true
sizes=("$@")
[ ${#sizes[@]} -gt 0 ] || sizes=(1000 10000 100000)

# A host of n ramdisks (/rd/000001 ...) and n tardisks.
scenario() {
  python3 - "$1" <<'PY'
import json, sys
n = int(sys.argv[1])
ramdisks, files, tardisks = [], [], []
for i in range(n):
    mount = f"/rd/{i:06d}"
    ramdisks.append({"name": f"rd{i:06d}", "mount_point": mount, "reserved_mib": i % 64,
                     "maximum_mib": 64 + i % 64, "reserved_inodes": i % 16, "coredump": i % 2 == 0})
    files.append({"path": mount + "/data", "text": "", "size": 4096 * (1 + i % 8)})
    tardisks.append({"name": f"pkg{i:06d}.t00", "size": 1000 + i, "system": i % 3 != 0})
json.dump({"format": 1, "ramdisks": ramdisks, "files": files, "tardisks": tardisks}, sys.stdout)
PY
}

# The medians of three runs of a command repeated REPS times, per command: wall seconds and CPU
# seconds; and the largest peak RSS (KiB).
measure() {
  local reps="$1" walls=() cpus=() rss=0
  shift
  for _ in 1 2 3; do
    local line
    line="$(/usr/bin/time -f '%e %U %S %M' sh -c \
      'r=$1; shift; while [ "$r" -gt 0 ]; do "$@" >/dev/null || exit 1; r=$((r - 1)); done' \
      sh "$reps" "$@" 2>&1 | tail -1)"
    read -r wall user system kib <<<"$line"
    walls+=("$(awk -v w="$wall" -v r="$reps" 'BEGIN { printf "%.4f", w / r }')")
    cpus+=("$(awk -v u="$user" -v s="$system" -v r="$reps" 'BEGIN { printf "%.4f", (u + s) / r }')")
    [ "$kib" -gt "$rss" ] && rss="$kib"
  done
  echo "$(printf '%s\n' "${walls[@]}" | sort -n | sed -n 2p) $(printf '%s\n' "${cpus[@]}" | sort -n | sed -n 2p) $rss"
}

declare -A base
printf '%-8s %-14s %8s %8s %12s %10s\n' rows command wall cpu "cpu us/row" "peak MiB"
for n in 0 "${sizes[@]}"; do
  export QUARN_HOST_STATE="$work/host-$n"
  scenario "$n" > "$work/scenario.json"
  "$build/bin/quarnhost" init --force --scenario "$work/scenario.json" >/dev/null
  rm -f "$work/scenario.json"
  for what in ramdisk tardisk; do
    reps=$((n > 0 && n < 100000 ? 100000 / n : 100))
    [ "$n" -ge 100000 ] && reps=1
    read -r wall cpu rss < <(measure "$reps" "$cli" system mirafs "$what" list)
    if [ "$n" = 0 ]; then base[$what]="$cpu"; continue; fi
    awk -v n="$n" -v w="$what list" -v s="$wall" -v c="$cpu" -v b="${base[$what]}" -v r="$rss" \
      'BEGIN { printf "%-8d %-14s %8.3f %8.3f %12.1f %10.1f\n", n, w, s, c, (c - b) * 1e6 / n, r / 1024 }'
  done
  rm -rf "$QUARN_HOST_STATE"
done
