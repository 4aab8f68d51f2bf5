#!/usr/bin/env bash
# Whole-process latency of the clock, uptime and maintenance-mode commands beside `date -u`,
# measured in the same run, and peak resident memory of quarncli and of the host management
# tool it starts. Sleeps on the host are off (sleep_percent 0), so what is measured is the
# commands' own cost: for `maintenanceMode set`, quarncli plus one run of /bin/kelp-cmd.
#   bench/power_latency.sh [BUILD_DIR]
# `system version get` runs beside them as the reference of a plain read (bench/latency.sh).
# Targets: the reads within 10% of `system version get`; a set (quarncli and the tool, two
# small write transactions) no slower than another write such as `system welcomemsg set`;
# every process under 6 MiB.
set -euo pipefail
source "$(dirname "${BASH_SOURCE[0]}")/common.sh" "${1:-}"
export QUARN_HOST_STATE="$work/host"
echo '{"format": 1, "simulation": {"sleep_percent": 0}, "maintenance": {"state": "disabled"}}' |
  "$host" init --scenario - >/dev/null

out="$(mktemp)"
hyperfine -N --warmup 50 --runs 500 --export-json "$out" \
  'date -u' "$cli system version get" "$cli system time get" "$cli system stats uptime get" \
  "$cli system maintenanceMode get" >/dev/null
out_set="$(mktemp)"
# Before each run the tool itself takes the host out of maintenance mode (it succeeds also when
# the host is out already), so every measured run enters it.
hyperfine -N --warmup 20 --runs 300 --export-json "$out_set" \
  --prepare "$work/host/root/bin/kelp-cmd hostsvc/maintenance_mode_exit 0" \
  "$cli system maintenanceMode set -e true" "$cli system welcomemsg set -m banner" >/dev/null
python3 - "$out" "$out_set" <<'PY'
import json, sys
reads = json.load(open(sys.argv[1]))["results"]
sets = json.load(open(sys.argv[2]))["results"]
base = reads[0]["median"]
for r in reads + sets:
    name = r["command"].split("/bin/")[-1]
    print(f"{name:<40} median {r['median'] * 1000:7.3f} ms  ({r['median'] / base:.2f}x date -u)")
PY
rm -f "$out" "$out_set"
"$cli" system maintenanceMode set -e false >/dev/null 2>&1 || true
rss() { /usr/bin/time -f %M "$@" 2>&1 >/dev/null | tail -1; }
mib() { awk -v k="$1" 'BEGIN { printf "%6.2f MiB", k / 1024 }'; }
echo "peak RSS quarncli system time get        $(mib "$(rss "$cli" system time get)")"
echo "peak RSS quarncli maintenanceMode set    $(mib "$(rss "$cli" system maintenanceMode set -e true)")"
echo "peak RSS kelp-cmd maintenance_mode_exit  $(mib "$(rss "$work/host/root/bin/kelp-cmd" hostsvc/maintenance_mode_exit 60)")"
