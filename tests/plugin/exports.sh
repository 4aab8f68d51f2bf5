#!/bin/sh
# Holds the plug-in's dynamic symbol table to its export list: every exported symbol belongs to a
# listed function or class, and every listed entry is exported.
#   exports.sh LIBRARY LIST
set -eu
nm -DC --defined-only "$1" | cut -d' ' -f3- | awk -v list="$2" '
  function covers(kind, name, symbol) {
    if (kind == "function") return symbol == name || index(symbol, name "(") == 1
    return index(symbol, name "::") == 1 || symbol ~ (" for " name "(-in-.*)?$") ||
           index(symbol, "thunk to " name "::") > 0
  }
  BEGIN {
    while ((getline line < list) > 0) {
      if (line ~ /^#/ || line ~ /^[ \t]*$/) continue
      n++; kind[n] = substr(line, 1, index(line, " ") - 1); plain[n] = substr(line, index(line, " ") + 1)
    }
  }
  {
    ok = 0
    for (i = 1; i <= n; i++) if (covers(kind[i], plain[i], $0)) { ok = 1; used[i] = 1 }
    if (!ok) { print "exported but not listed: " $0; bad = 1 }
  }
  END {
    for (i = 1; i <= n; i++) if (!used[i]) { print "listed but not exported: " kind[i] " " plain[i]; bad = 1 }
    exit bad
  }'
