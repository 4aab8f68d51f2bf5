#!/usr/bin/env bash
# Builds the libFuzzer targets (a clang build in build-fuzz/) and runs each for SECONDS, starting
# from its corpus in fuzz/corpus/<target>/ (new inputs go to a scratch copy, never into the
# repository). Prints each target's executions, coverage and crashes; exits non-zero when one
# crashed (the crashing input is kept in build-fuzz/crashes/).
#   fuzz/run.sh [SECONDS] [TARGET...]      e.g. fuzz/run.sh 600, fuzz/run.sh 30 snmp_config
set -euo pipefail
root="$(cd "$(dirname "${BASH_SOURCE[0]}")/.." && pwd)"
seconds=${1:-60}
shift || true
targets=("$@")
((${#targets[@]})) || targets=(option_parser scenario_import version_record mirafs_options
                               snmp_config secret_file format_param)
if ! dpkg-query -W -f='${Status}' clang libclang-rt-14-dev 2>/dev/null | grep -q "ok installed"; then
  [ "$(id -u)" -eq 0 ] || { echo "fuzz/run.sh: clang and libclang-rt-14-dev are needed" >&2; exit 1; }
  DEBIAN_FRONTEND=noninteractive apt-get install -y -qq --no-install-recommends \
    clang libclang-rt-14-dev >/dev/null
fi
build="$root/build-fuzz"
CC=clang CXX=clang++ cmake -S "$root" -B "$build" -DQUARN_FUZZ=ON -DQUARN_TESTS=OFF \
  -DQUARN_BENCH=OFF -DCMAKE_BUILD_TYPE=RelWithDebInfo >/dev/null
cmake --build "$build" -j"$(nproc)" --target "${targets[@]/#/fuzz_}" >/dev/null
work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT
mkdir -p "$build/crashes"
status=0
export ASAN_OPTIONS="detect_leaks=1:abort_on_error=1" UBSAN_OPTIONS="halt_on_error=1"
for target in "${targets[@]}"; do
  corpus="$work/$target"
  mkdir -p "$corpus"
  cp -r "$root/fuzz/corpus/$target/." "$corpus/" 2>/dev/null || true
  log="$work/$target.log"
  if "$build/bin/fuzz_$target" -max_total_time="$seconds" -print_final_stats=1 \
       -artifact_prefix="$build/crashes/$target-" "$corpus" >"$log" 2>&1; then
    crashes=0
  else
    crashes=1
    status=1
  fi
  runs=$(sed -n 's/^stat::number_of_executed_units: *//p' "$log" | tail -1)
  cov=$(grep -o 'cov: [0-9]*' "$log" | tail -1 | cut -d' ' -f2)
  printf '%-16s %6ss  %10s executions  coverage %5s  crashes %s\n' \
    "$target" "$seconds" "${runs:-?}" "${cov:-?}" "$crashes"
  ((crashes == 0)) || tail -30 "$log"
done
exit $status
