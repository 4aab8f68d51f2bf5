#!/usr/bin/env bash
# Writes the manual pages into OUT_DIR from what the built programs say of themselves.
#   generate.sh QUARNCLI QUARNHOST QUARNMAN OUT_DIR
set -euo pipefail
cli=$1 host=$2 man=$3 out=$4
work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT
mkdir -p "$out"
# The pages describe the programs, not a host: a throw-away one answers what needs a host.
export QUARN_HOST_STATE="$work/host" COLUMNS=78
"$cli" --help >"$work/cli.help"
for top in $("$cli" __complete ""); do
  [[ $top == -* ]] && continue
  "$cli" --schema "$top" >"$work/$top.json"
  "$man" reference "$work/$top.json" >"$out/quarncli-$top.1"
  cli_schema="$work/$top.json"
done
"$man" cli "$cli_schema" "$work/cli.help" >"$out/quarncli.1"
# quarnhost's help, then each subcommand's (and theirs), as its help lists them.
subcommands() { sed -n '/^Subcommands:/,/^$/p' | awk 'NF && !/^Subcommands:/ {print $1}'; }
helps=("$work/host.help")
"$host" --help >"$work/host.help"
for sub in $(subcommands <"$work/host.help"); do
  "$host" "$sub" --help >"$work/host-$sub.help"
  helps+=("$work/host-$sub.help")
  for subsub in $(subcommands <"$work/host-$sub.help"); do
    "$host" "$sub" "$subsub" --help >"$work/host-$sub-$subsub.help"
    helps+=("$work/host-$sub-$subsub.help")
  done
done
"$man" host "${helps[@]}" >"$out/quarnhost.1"
