# The set-up every benchmark script shares, sourced right after `set -euo pipefail`:
#   source "$(dirname "${BASH_SOURCE[0]}")/common.sh" "${1:-}" [PACKAGE:PROGRAM...]
# Sets root, build (the given build directory, or build/), cli, host and work (a scratch
# directory removed on exit), and installs hyperfine, time and each PACKAGE whose PROGRAM is
# missing.
root="$(cd "$(dirname "${BASH_SOURCE[0]}")/.." && pwd)"
build="${1:-$root/build}"
shift || true
cli="$build/bin/quarncli"
host="$build/bin/quarnhost"
for tool in hyperfine:hyperfine time:/usr/bin/time "$@"; do
  pkg="${tool%%:*}" bin="${tool#*:}"
  if ! command -v "$bin" >/dev/null; then apt-get install -y -qq "$pkg" >/dev/null; fi
done
work="$(mktemp -d)"
trap 'rm -rf "$work"' EXIT
