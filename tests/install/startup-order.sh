#!/bin/sh
# quarncli's text starts with the code its commands run (cli/startup-order.ld): functions that
# every command runs lie in the first quarter of the text, not where the link order puts them.
#   startup-order.sh PROGRAM
set -eu
program="$1"
# .text's address and size
set -- $(readelf -SW "$program" | sed 's/^ *\[ *[0-9]*\]//' | awk '$1 == ".text" { print $3, $5 }')
start=$((0x$1)) size=$((0x$2))
status=0
for symbol in main _ZN7Kitbase3Cli4MainEiPPc sqlite3_open_v2 _ZN7simhost7Session4OpenERKNSt7__cxx1112basic_stringIcSt11char_traitsIcESaIcEEE; do
  address=$(nm --defined-only "$program" | awk -v s="$symbol" '$3 == s { print $1; exit }')
  if [ -z "$address" ]; then
    echo "startup-order: $symbol is not in $program"; status=1; continue
  fi
  offset=$((0x$address - start))
  if [ "$offset" -lt 0 ] || [ "$offset" -ge $((size / 4)) ]; then
    echo "startup-order: $symbol is at $offset bytes into a text of $size, not in its first quarter"
    status=1
  fi
done
exit $status
