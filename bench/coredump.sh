#!/usr/bin/env bash
# The core dump lists at scale, run by hand after a build:
#   bench/coredump.sh [BUILD_DIR]
# Generated hosts of 1k, 10k and 100k diagnostic partitions (ten per disk) and as many dump files
# (real sparse files with the dump-file header, under the host's root/): median time and peak
# resident memory of `system coredump partition list` and `system coredump file list`, and
# their cost per row above a host without partitions and files. Target: flat within 25%.
set -euo pipefail
source "$(dirname "${BASH_SOURCE[0]}")/common.sh" "${1:-}" python3:python3

# A scenario of n diagnostic partitions and n dump files of 100 MB each (n may be 0).
generate() {
  python3 - "$1" <<'PY'
import json, sys
n = int(sys.argv[1])
disks = [{"name": f"bench.disk{d:05d}",
          "partitions": [{"number": p + 1, "type": "diagnostic", "size_mb": 110 + p}
                         for p in range(min(10, n - d * 10))]}
         for d in range((n + 9) // 10)]
mount = "/qrfs/volumes/bench-01"
header = "NORLITHDUMPFILE\nversion: 1\nsize-mb: 100\n"
paths = [f"{mount}/norlithdump/dump{i:06d}.dumpfile" for i in range(n)]
files = [{"path": p, "text": header, "size": 100 * 1048576} for p in paths]
json.dump({"format": 1, "files": files,
           "dump_partitions": {"disks": disks, "active": f"bench.disk00000:1" if n else "",
                               "configured": f"bench.disk00000:1" if n else ""},
           "dump_files": {"datastores": [{"name": "bench-01", "mount": mount,
                                          "capacity_mb": 1 << 40, "free_mb": 1 << 39}],
                          "files": [{"path": p, "datastore": "bench-01", "size_mb": 100} for p in paths],
                          "active": paths[0] if n else "", "configured": paths[-1] if n else ""}},
          sys.stdout)
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

make_host empty 0
for n in 1000 10000 100000; do make_host "h$n" "$n"; done
for command in "partition list" "file list"; do
  read -r base_ms < <(RUNS=40 median_ms "$cli --host-state $work/empty system coredump $command")
  base_kib="$(peak_kib "$cli" --host-state "$work/empty" system coredump $command)"
  printf "%-14s rows  median ms  peak KiB  us/row above empty  KiB/row above empty\n" "$command"
  for n in 1000 10000 100000; do
    runs=40; [ "$n" = 10000 ] && runs=15; [ "$n" = 100000 ] && runs=5
    read -r ms < <(RUNS=$runs WARMUP=1 median_ms "$cli --host-state $work/h$n system coredump $command")
    kib="$(peak_kib "$cli" --host-state "$work/h$n" system coredump $command)"
    awk -v n="$n" -v ms="$ms" -v kib="$kib" -v bms="$base_ms" -v bkib="$base_kib" 'BEGIN {
      printf "%-14s %6d  %9.2f  %8d  %18.2f  %19.3f\n", "", n, ms, kib, (ms - bms) * 1000 / n, (kib - bkib) / n }'
  done
done
