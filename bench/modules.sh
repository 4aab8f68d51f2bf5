#!/usr/bin/env bash
# The module list at scale, run by hand after a build:
#   bench/modules.sh [BUILD_DIR]
# 1. `quarncli system module list` on the default host (131 modules) beside `lsmod` on this
#    machine: medians of one hyperfine run and peak resident memory. (Where /proc/modules is
#    missing, as in some containers, lsmod fails at once; its figures are then only the cost of
#    starting it.)
# 2. Generated hosts of 1k, 10k and 100k modules (each with namespaces, parameters and a stored
#    option string, a mix of loaded, enabled and disabled): median time and peak resident memory
#    of `module list`, and its cost per module above a host without modules. Target: flat within
#    25% from 1k to 100k.
# 3. `module list --loaded false` on the 100k host: the filter costs the same walk.
set -euo pipefail
source "$(dirname "${BASH_SOURCE[0]}")/common.sh" "${1:-}" python3:python3 kmod:lsmod

# A scenario of n modules (n may be 0) and a few log levels per hundred modules.
generate() {
  python3 - "$1" <<'PY'
import json, sys
n = int(sys.argv[1])
kinds = ["nic", "stor", "fs", "dev", "sec"]
modules, levels = [], []
for i in range(n):
    kind = kinds[i % len(kinds)]
    name = f"{kind}_unit{i}"
    state = i % 10
    modules.append({
        "name": name, "file": f"/usr/lib/norlith/modules/{name}.nmod", "license": "Tarsel",
        "version": f"{1 + i % 7}.{i % 13}.0", "file_version": f"{1 + i % 7}.{i % 13}.0-24.11.{20000 + i}",
        "signed_status": "Signed by platform key", "signature_issuer": "Tarsel Norlith Module Signing CA 2",
        "signature_digest": f"{i:064x}", "signature_fingerprint": ":".join(f"{(i >> (k % 4)) & 255:02X}" for k in range(20)),
        "provides": {"name": f"{kind}_api{i}", "versions": ["1.0"]} if i % 3 == 0 else {"name": "", "versions": []},
        "requires": [{"name": f"{kind}_api{i // 3 * 3}", "versions": ["1.0"]}, {"name": "norlith_api", "versions": ["4.2"]}],
        "parameters": [{"name": "queues", "type": "uint", "description": f"Queues of unit {i}."},
                       {"name": "debug", "type": "bool", "description": "Log every request."}],
        "options": "queues=4" if i % 4 == 0 else "",
        "loaded": state < 8, "enabled": state < 7 or state == 8})
    if i % 100 == 0:
        levels.append({"module": name, "name": "Trace", "current": 1, "default": 1})
json.dump({"format": 1, "modules": modules, "log_levels": levels}, sys.stdout)
PY
}

make_host() {  # name size
  generate "$2" > "$work/$1.json"
  "$host" --state "$work/$1" init --scenario "$work/$1.json" >/dev/null
}

median_ms() {  # command...
  local out="$work/hyperfine.json"
  hyperfine -N -i --warmup "${WARMUP:-3}" --runs "${RUNS:-15}" --export-json "$out" "$@" >/dev/null 2>&1
  python3 - "$out" <<'PY'
import json, sys
print(" ".join(f"{r['median'] * 1000:.3f}" for r in json.load(open(sys.argv[1]))["results"]))
PY
}

peak_kib() { /usr/bin/time -f %M "$@" 2>&1 >/dev/null | tail -1; }

"$host" --state "$work/default" init >/dev/null
echo "== module list on the default host beside lsmod"
if lsmod >/dev/null 2>&1; then lsmod_note="$(lsmod | tail -n +2 | wc -l) modules"; else lsmod_note="fails here: no /proc/modules"; fi
read -r lsmod_ms list_ms < <(RUNS=100 WARMUP=10 median_ms "lsmod" "$cli --host-state $work/default system module list")
lsmod_kib="$(peak_kib lsmod || true)"
list_kib="$(peak_kib "$cli" --host-state "$work/default" system module list)"
printf "lsmod (%s)                 median %8.3f ms  peak %6s KiB\n" "$lsmod_note" "$lsmod_ms" "$lsmod_kib"
printf "quarncli system module list (131)  median %8.3f ms  peak %6s KiB\n" "$list_ms" "$list_kib"

echo "== module list on generated hosts"
make_host empty 0
for n in 1000 10000 100000; do make_host "h$n" "$n"; done
read -r base_ms < <(RUNS=40 median_ms "$cli --host-state $work/empty system module list")
base_kib="$(peak_kib "$cli" --host-state "$work/empty" system module list)"
printf "modules  median ms  peak KiB  us/module above empty  KiB/module above empty\n"
for n in 1000 10000 100000; do
  runs=40; [ "$n" = 10000 ] && runs=15; [ "$n" = 100000 ] && runs=5
  read -r ms < <(RUNS=$runs WARMUP=1 median_ms "$cli --host-state $work/h$n system module list")
  kib="$(peak_kib "$cli" --host-state "$work/h$n" system module list)"
  awk -v n="$n" -v ms="$ms" -v kib="$kib" -v bms="$base_ms" -v bkib="$base_kib" 'BEGIN {
    printf "%7d  %9.2f  %8d  %21.2f  %22.3f\n", n, ms, kib, (ms - bms) * 1000 / n, (kib - bkib) / n }'
done

echo "== filtered list on the 100k host"
read -r all_ms filtered_ms < <(RUNS=5 WARMUP=1 median_ms "$cli --host-state $work/h100000 system module list" \
  "$cli --host-state $work/h100000 system module list --loaded false")
awk -v a="$all_ms" -v f="$filtered_ms" 'BEGIN {
  printf "all %.1f ms, --loaded false %.1f ms (%.2fx)\n", a, f, f / a }'
