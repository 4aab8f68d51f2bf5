#!/usr/bin/env bash
# Builds the Debian package of this build, unpacks it into a scratch root and uses it from there:
# the programs run, the plug-in is found beside them, the manual pages render and the bash
# completion answers.
#   package.sh BUILD_DIR
set -euo pipefail
build=$1
work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT
cpack --config "$build/CPackConfig.cmake" -B "$work/out" >"$work/cpack.log" 2>&1 ||
  { cat "$work/cpack.log"; exit 1; }
deb=$(ls "$work"/out/*.deb)
dpkg-deb --field "$deb" Package Depends
root="$work/root"
dpkg-deb -x "$deb" "$root"
for f in usr/bin/quarncli usr/bin/quarnhost usr/lib/quarncli/plugins/libsystem.so \
         usr/lib/quarncli/modules/libquarnsnmp.so usr/libexec/quarn/kelp-cmd \
         usr/share/bash-completion/completions/quarncli usr/share/man/man1/quarncli.1 \
         usr/share/man/man1/quarncli-system.1 usr/share/man/man1/quarnhost.1 \
         usr/include/kitbase/AutoCli.h usr/include/norlithctl/RavelException.h; do
  [[ -e $root/$f ]] || { echo "FAIL: the package lacks /$f"; exit 1; }
done
export QUARN_HOST_STATE="$work/host"
out=$("$root/usr/bin/quarncli" system version get 2>&1)
grep -q "Product: Quarn" <<<"$out" || { echo "FAIL: quarncli from the package: $out"; exit 1; }
"$root/usr/bin/quarnhost" journal >/dev/null
# Every page renders without a warning, and the reference names every command.
for page in "$root"/usr/share/man/man1/*.1; do
  warnings=$(MANWIDTH=80 man --warnings -l "$page" 2>&1 >/dev/null || true)
  [[ -z $warnings ]] || { echo "FAIL: $page: $warnings"; exit 1; }
done
text=$(MANWIDTH=200 man -l "$root/usr/share/man/man1/quarncli-system.1" 2>/dev/null)
"$root/usr/bin/quarncli" --schema system | grep -o '"path": "[^"]*"' | cut -d'"' -f4 |
  while read -r path; do
    grep -qF -- "$path" <<<"$text" || { echo "FAIL: the reference page lacks '$path'"; exit 1; }
  done
PATH="$root/usr/bin:$PATH" bash -c "
  source '$root/usr/share/bash-completion/completions/quarncli'
  COMP_WORDS=(quarncli system ver); COMP_CWORD=2
  _quarncli; [[ \${COMPREPLY[*]} == version ]]" ||
  { echo "FAIL: completion from the package"; exit 1; }
echo "package: $(basename "$deb") installs and runs"
