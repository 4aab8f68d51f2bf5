#!/usr/bin/env bash
# Runs every example of docs/examples.md and checks it shows what the page says.
#   examples.sh EXAMPLES_MD BIN_DIR
#
# The page's sessions are the fenced blocks marked "console": each starts on a fresh default
# host; a line "$ COMMAND" is run (by bash, with the built programs first on the path) and the
# lines up to the next "$ " line or the block's end are what it must print, standard output and
# standard error together. A line "..." stands for any number of lines, and "..." within a line
# for any text there.
set -uo pipefail
page=$1
bin=$(cd "$2" && pwd)
tmp=$(mktemp -d)
trap 'rm -rf "$tmp"' EXIT
export PATH="$bin:$PATH" COLUMNS=100
failures=0 checked=0

# matches EXPECTED_FILE ACTUAL_FILE: whether the output fits the expected lines.
matches() {
    awk -v expected="$1" '
        BEGIN { n = 0; while ((getline line < expected) > 0) want[n++] = line }
        { sub(/\r$/, ""); got[m++] = $0 }  # csv ends its lines with CR LF
        function fit(i, j,    k) {
            if (i == n) return j == m
            if (want[i] == "...") {
                for (k = j; k <= m; k++) if (fit(i + 1, k)) return 1
                return 0
            }
            if (j == m) return 0
            if (index(want[i], "...") > 0) {
                if (got[j] !~ pattern(want[i])) return 0
            } else if (want[i] != got[j]) return 0
            return fit(i + 1, j + 1)
        }
        # The line as an anchored regular expression: its text literal, each "..." any text.
        function pattern(line,    out, c, k) {
            out = "^"
            for (k = 1; k <= length(line); k++) {
                if (substr(line, k, 3) == "...") { out = out ".*"; k += 2; continue }
                c = substr(line, k, 1)
                out = out (index("\\.[]()*+?{}|^$/", c) ? "\\" c : c)
            }
            return out "$"
        }
        END { exit fit(0, 0) ? 0 : 1 }' "$2"
}

run_block() {  # the block's lines are in $tmp/block
    local host="$tmp/host.$RANDOM$RANDOM"
    export QUARN_HOST_STATE="$host"
    quarnhost init >/dev/null 2>&1
    local command="" expected="$tmp/expected" actual="$tmp/actual"
    : >"$expected"
    finish() {
        [[ -n $command ]] || return 0
        checked=$((checked + 1))
        (cd "$tmp" && bash -c "$command") >"$actual" 2>&1
        if ! matches "$expected" "$actual"; then
            failures=$((failures + 1))
            echo "FAIL: \$ $command"
            diff -u "$expected" "$actual" | tail -n +3 | head -40
        fi
        : >"$expected"
    }
    while IFS= read -r line; do
        if [[ $line == '$ '* ]]; then
            finish
            command=${line#\$ }
        else
            printf '%s\n' "$line" >>"$expected"
        fi
    done <"$tmp/block"
    finish
    rm -rf "$host"
}

in_block=0
while IFS= read -r line; do
    if ((in_block)); then
        if [[ $line == '```' ]]; then
            run_block
            in_block=0
        else
            printf '%s\n' "$line" >>"$tmp/block"
        fi
    elif [[ $line == '```console' ]]; then
        in_block=1
        : >"$tmp/block"
    fi
done <"$page"

if ((checked == 0)); then
    echo "FAIL: no example found in $page"
    exit 1
fi
if ((failures)); then
    echo "$failures of $checked examples differ from the page"
    exit 1
fi
echo "examples: all $checked match"
