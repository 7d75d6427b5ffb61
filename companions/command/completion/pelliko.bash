# Completion of pelliko for bash. It needs nothing but bash itself.

# People whose name begins with what was typed, whatever the case; quotes and backslashes of the typed word do not count.
_pelliko_people() {
    local typed=${1//\\/} name number
    typed=${typed#[\"\']}
    while IFS=$'\t' read -r name number; do
        [[ ${name,,} == "${typed,,}"* ]] && COMPREPLY+=("$name")
    done < <(pelliko contacts 2>/dev/null)
    # The shell quotes what has to be, as it does with names of files.
    compopt -o filenames 2>/dev/null
}

_pelliko() {
    local word=${COMP_WORDS[COMP_CWORD]} before=${COMP_WORDS[COMP_CWORD - 1]} command='' options='--help' i
    COMPREPLY=()
    for ((i = 1; i < COMP_CWORD; ++i)); do
        [[ ${COMP_WORDS[i]} == -* ]] || { command=${COMP_WORDS[i]}; break; }
    done
    if [[ -z $command ]]; then
        mapfile -t COMPREPLY < <(compgen -W 'share text contacts status --help --version' -- "$word")
        return
    fi
    case $command in
        share | text)
            if [[ $before == --to ]]; then _pelliko_people "$word"; return; fi
            options='--to --help' ;;
        contacts) options='--json --help' ;;
        status) options='--follow --json --help' ;;
    esac
    if [[ $word == -* ]]; then
        mapfile -t COMPREPLY < <(compgen -W "$options" -- "$word")
    elif [[ $command == share ]]; then
        mapfile -t COMPREPLY < <(compgen -f -- "$word")
        compopt -o filenames 2>/dev/null
    fi
}

complete -F _pelliko pelliko
