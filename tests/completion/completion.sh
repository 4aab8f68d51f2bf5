#!/usr/bin/env bash
# Drives quarncli's bash completion the way bash does (COMP_WORDS, COMP_CWORD, then the
# completion function) and checks what it offers.
#   completion.sh COMPLETION_SCRIPT QUARNCLI
set -uo pipefail
script=$1
cli=$2
tmp=$(mktemp -d)
trap 'rm -rf "$tmp"' EXIT
export QUARN_HOST_STATE="$tmp/host"
mkdir -p "$tmp/bin" "$tmp/dirs/alpha" "$tmp/dirs/beta"
# Completion runs the program by the name typed: put the built one on the path.
ln -s "$(readlink -f "$cli")" "$tmp/bin/quarncli"
export PATH="$tmp/bin:$PATH"
# shellcheck source=/dev/null
source "$script"

failures=0

# complete LINE: COMPREPLY for the command line LINE, the cursor at its end, split as bash splits
# it (blanks, and "=" as a word of its own).
complete_line() {
    local line=$1
    local spaced=${line//=/ = }
    read -r -a COMP_WORDS <<<"$spaced"
    [[ $line == *" " || $line == *"=" ]] && COMP_WORDS+=("")
    [[ $line == *"=" ]] && unset 'COMP_WORDS[${#COMP_WORDS[@]}-1]'
    COMP_CWORD=$((${#COMP_WORDS[@]} - 1))
    COMPREPLY=()
    _quarncli quarncli "${COMP_WORDS[COMP_CWORD]}" "${COMP_WORDS[COMP_CWORD-1]:-}" 2>"$tmp/stderr"
    if [[ -s $tmp/stderr ]]; then
        echo "FAIL: '$line' wrote to standard error: $(cat "$tmp/stderr")"
        failures=$((failures + 1))
    fi
    printf '%s\n' "${COMPREPLY[@]}" | LC_ALL=C sort
}

expect() {  # LINE EXPECTED... (the whole set, in any order)
    local line=$1
    shift
    local got want
    got=$(complete_line "$line")
    want=$(printf '%s\n' "$@" | LC_ALL=C sort)
    [[ $# -eq 0 ]] && want=""
    if [[ $got != "$want" ]]; then
        echo "FAIL: '$line'"
        echo "  want: $(echo $want)"
        echo "  got:  $(echo $got)"
        failures=$((failures + 1))
    fi
}

expect_has() {  # LINE CANDIDATE...: each candidate is among those offered
    local line=$1
    shift
    local got
    got=$(complete_line "$line")
    for candidate in "$@"; do
        if ! grep -qxF -- "$candidate" <<<"$got"; then
            echo "FAIL: '$line' does not offer '$candidate' (got: $(echo $got))"
            failures=$((failures + 1))
        fi
    done
}

"$cli" system version get >/dev/null 2>&1  # the host exists before completion is tried

# Command paths, from the root down.
expect "quarncli " system
expect "quarncli sys" system
expect "quarncli system time " get set
expect "quarncli system settings kernel l" list
expect "quarncli system mirafs ramdisk " add list remove
expect_has "quarncli system " hostname version time snmp settings

# Option names: the command's own, then the global ones allowed after the path.
expect "quarncli system hostname set --f" --fqdn --formatter --format-param
expect_has "quarncli system hostname set --" --host --domain --fqdn --formatter --host-state --plugin-dir --schema
expect_has "quarncli --" --formatter --host-state --plugin-dir --version --schema --help
expect "quarncli --vers" --version

# Values: booleans, formatters; directories for the state and plug-in options.
expect "quarncli system settings kernel set --setting=x --value " 
expect "quarncli system snmp set --enable " true false yes no 1 0
expect "quarncli system snmp set --enable t" true
expect "quarncli system snmp set --enable=" true false yes no 1 0
expect "quarncli system snmp set --enable=f" false
expect "quarncli --formatter " csv json keyvalue simple table xml
expect "quarncli --formatter=j" json
expect "quarncli system version get --formatter x" xml
expect "quarncli --host-state $tmp/dirs/a" "$tmp/dirs/alpha"
expect "quarncli --plugin-dir=$tmp/dirs/b" "$tmp/dirs/beta"
expect_has "quarncli --formatter json system ti" time

# Nothing, and nothing on the terminal, for what cannot be completed.
expect "quarncli nosuch "
expect "quarncli system nosuch x"
expect "quarncli system version get extra "
expect "quarncli --plugin-dir $tmp/dirs/alpha system "
expect "quarncli --plugin-dir $tmp/missing "
expect "quarncli system hostname set --host "
expect "quarncli 'system "

# The program answers with exit 0 even for nonsense.
if ! "$cli" __complete --formatter >/dev/null 2>&1; then
    echo "FAIL: quarncli __complete exits non-zero"
    failures=$((failures + 1))
fi

if ((failures)); then
    echo "$failures completion check(s) failed"
    exit 1
fi
echo "completion: all checks passed"
