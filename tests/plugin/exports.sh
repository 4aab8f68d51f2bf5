#!/bin/sh
# Fails unless the plug-in's entry point is the one symbol it exports.
set -eu
exported=$(nm -D --defined-only "$1" | awk '{print $2 " " $3}')
if [ "$exported" != "T AutoCli_RegisterNamespaces" ]; then
  echo "exported symbols:"; echo "$exported"; exit 1
fi
