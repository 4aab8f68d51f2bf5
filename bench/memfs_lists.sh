#!/usr/bin/env bash
# The cost per row of `system mirafs ramdisk list` and `system mirafs tardisk list` on generated
# hosts of 1,000, 10,000 and 100,000 ramdisks and tardisks (each ramdisk with a directory and one
# file under root/, so that its usage is walked), and quarncli's peak resident memory. Run by
# hand after a build:
#   bench/memfs_lists.sh [BUILD_DIR] [SIZES...]
# Target: the time per row flat within 25% from 1k to 100k rows. Each figure is the median of
# three runs; the host is made (quarnhost init) before and outside the measure.
set -euo pipefail
root="$(cd "$(dirname "${BASH_SOURCE[0]}")/.." && pwd)"
build="${1:-$root/build}"
shift || true
sizes=("$@")
[ ${#sizes[@]} -gt 0 ] || sizes=(1000 10000 100000)
cli="$build/bin/quarncli"
if ! [ -x /usr/bin/time ]; then apt-get install -y -qq time >/dev/null; fi
work="$(mktemp -d)"
trap 'rm -rf "$work"' EXIT

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

# Median wall seconds and the peak RSS (KiB) of the largest of three runs of a command.
measure() {
  local times=() rss=0
  for _ in 1 2 3; do
    local line
    line="$(/usr/bin/time -f '%e %M' "$@" 2>&1 >/dev/null | tail -1)"
    times+=("${line% *}")
    [ "${line#* }" -gt "$rss" ] && rss="${line#* }"
  done
  printf '%s\n' "${times[@]}" | sort -n | sed -n 2p | tr '\n' ' '
  echo "$rss"
}

printf '%-8s %-14s %10s %12s %10s\n' rows command seconds "us/row" "peak MiB"
for n in "${sizes[@]}"; do
  export QUARN_HOST_STATE="$work/host-$n"
  scenario "$n" > "$work/scenario.json"
  "$build/bin/quarnhost" init --force --scenario "$work/scenario.json" >/dev/null
  rm -f "$work/scenario.json"
  for what in ramdisk tardisk; do
    read -r seconds rss < <(measure "$cli" system mirafs "$what" list)
    awk -v n="$n" -v w="$what list" -v s="$seconds" -v r="$rss" \
      'BEGIN { printf "%-8d %-14s %10.3f %12.2f %10.2f\n", n, w, s, s * 1e6 / n, r / 1024 }'
  done
  rm -rf "$QUARN_HOST_STATE"
done
