#!/bin/sh
# Fails when the plug-in exports any symbol but its entry point. The type information of Boost's
# shared-pointer control block is the one exception: Boost makes it visible on purpose, so that
# shared pointers passed between the program and its plug-ins agree on it.
set -eu
extra=$(nm -D --defined-only "$1" | awk '{print $3}' |
        grep -v -x -e AutoCli_RegisterNamespaces -e _init -e _fini \
                   -e '_ZT[IS]N5boost6detail15sp_counted_baseE' || true)
if [ -n "$extra" ]; then
  echo "unexpected exported symbols:"; echo "$extra"; exit 1
fi
nm -D --defined-only "$1" | grep -q ' T AutoCli_RegisterNamespaces$'
