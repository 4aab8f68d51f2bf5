# bash completion for quarncli.
#
# quarncli answers itself (`quarncli __complete WORD... CURRENT`), from the same tree a run
# would use; directories for --host-state and --plugin-dir are bash's own. Nothing is ever
# written to the terminal: a failure simply gives no candidates.

_quarncli() {
    local i word joined=0
    local -a words=()
    # Bash splits "--formatter=json" into "--formatter" "=" "json": put such words together again.
    for ((i = 1; i <= COMP_CWORD; i++)); do
        word=${COMP_WORDS[i]}
        if ((${#words[@]} > 0)) && [[ $word == "=" || $joined == 1 ]]; then
            words[${#words[@]}-1]+=$word
            [[ $word == "=" ]] && joined=1 || joined=0
        else
            words+=("$word")
            joined=0
        fi
    done
    ((${#words[@]} > 0)) || words=("")
    local cur=${words[${#words[@]}-1]}
    local prev=""
    ((${#words[@]} > 1)) && prev=${words[${#words[@]}-2]}

    local IFS=$'\n'
    case $cur in
        --host-state=* | --plugin-dir=*)
            COMPREPLY=($(compgen -d -- "${cur#*=}"))
            return 0
            ;;
    esac
    case $prev in
        --host-state | --plugin-dir)
            COMPREPLY=($(compgen -d -- "$cur"))
            return 0
            ;;
    esac
    local -a found=($("${COMP_WORDS[0]}" __complete "${words[@]}" 2>/dev/null))
    # Readline replaces only what follows the last "=" of the word.
    if [[ $cur == *=* ]]; then
        local strip="${cur%=*}="
        found=("${found[@]#"$strip"}")
    fi
    COMPREPLY=("${found[@]}")
    return 0
}

complete -F _quarncli quarncli
