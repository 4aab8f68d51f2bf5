#!/bin/sh
# Fails when the plug-in exports any symbol but its entry point.
set -eu
extra=$(nm -D --defined-only "$1" | awk '{print $3}' |
        grep -v -x -e AutoCli_RegisterNamespaces -e _init -e _fini || true)
if [ -n "$extra" ]; then
  echo "unexpected exported symbols:"; echo "$extra"; exit 1
fi
nm -D --defined-only "$1" | grep -q ' T AutoCli_RegisterNamespaces$'
