# SPDX-License-Identifier: MIT
# bash completion for jexjtag.  Commands and options are read from the
# program's own --help pages, so new commands complete without a change here.

_jexjtag_commands() {
    "$1" --help 2>/dev/null | sed -n '/^Commands:/,/^$/s/^  \([a-z][a-z-]*\).*/\1/p'
}

_jexjtag_options() {
    "$1" ${2:+"$2"} --help 2>/dev/null | grep -o -- '--[a-z][a-z-]*' | sort -u
}

_jexjtag() {
    local cur prev program command i
    cur=${COMP_WORDS[COMP_CWORD]}
    prev=${COMP_WORDS[COMP_CWORD-1]}
    program=${COMP_WORDS[0]}
    command=
    for ((i = 1; i < COMP_CWORD; i++)); do
        case ${COMP_WORDS[i]} in
            -t|--target|-a|--arg|--chain|--lock-wait|--datadir|--log-level|--log-file|-d|--device|-n|--bits|--exit|--ir)
                ((i++)) ;;
            -*) ;;
            *) command=${COMP_WORDS[i]}; break ;;
        esac
    done

    case $prev in
        -t|--target)
            COMPREPLY=($(compgen -W "$("$program" targets 2>/dev/null | awk 'NF >= 3 && $1 ~ /^[0-9]+$/ {print $2}')" -- "$cur"))
            return ;;
        --datadir)
            COMPREPLY=($(compgen -d -- "$cur"))
            return ;;
        --log-file)
            COMPREPLY=($(compgen -f -- "$cur"))
            return ;;
        --log-level)
            COMPREPLY=($(compgen -W "0 1 2 3 4 5" -- "$cur"))
            return ;;
        --exit)
            COMPREPLY=($(compgen -W "test-logic-reset run-test-idle select-dr-scan capture-dr shift-dr exit1-dr pause-dr exit2-dr update-dr select-ir-scan capture-ir shift-ir exit1-ir pause-ir exit2-ir update-ir idle reset" -- "$cur"))
            return ;;
        -a|--arg|--chain|--lock-wait|-d|--device|-n|--bits|--ir)
            return ;;
    esac

    if [[ $cur == -* ]]; then
        COMPREPLY=($(compgen -W "$(_jexjtag_options "$program" "$command")" -- "$cur"))
    elif [[ -z $command ]]; then
        COMPREPLY=($(compgen -W "$(_jexjtag_commands "$program")" -- "$cur"))
    else
        case $command in
            shift) [[ $prev == shift ]] && COMPREPLY=($(compgen -W "ir dr" -- "$cur")) ;;
            help) [[ $prev == help ]] && COMPREPLY=($(compgen -W "$(_jexjtag_commands "$program")" -- "$cur")) ;;
            targets|scan|info|lookup) ;;
            *) COMPREPLY=($(compgen -f -- "$cur")) ;;
        esac
    fi
}

complete -F _jexjtag jexjtag
