# Looks at a command's arguments before anything else is done. What there is stands in the command's help: a line
# that begins with two blanks and a word names an option, with what follows it, or something else that may be given.

# Fills ARGUMENTS with the words after the command; names of files are made absolute, since ./dev works at its root.
read_arguments() {
    local command=$1 word value_kind
    shift
    ARGUMENTS=()
    while (($#)); do
        word=$1
        shift
        case $word in
            -h | --help) exec cat "$PARTS/help/$command.txt" ;;
            --*=*)
                value_kind=$(option_value "$command" "${word%%=*}")
                [[ -n $value_kind ]] || refuse "$command" "${word%%=*} takes no value"
                take_value "$command" "${word%%=*}" "$value_kind" "${word#*=}"
                ;;
            -*)
                value_kind=$(option_value "$command" "$word")
                if [[ -z $value_kind ]]; then
                    ARGUMENTS+=("$word")
                    continue
                fi
                (($#)) || refuse "$command" "$word needs a value: $value_kind"
                take_value "$command" "$word" "$value_kind" "$1"
                shift
                ;;
            *)
                if takes_rest "$command" "$word"; then
                    ARGUMENTS+=("$word" "$@")
                    return
                fi
                knows_word "$command" "$word" || refuse "$command" "there is no '$word' here"
                ARGUMENTS+=("$word")
                ;;
        esac
    done
}

refuse() {
    fail "$1: $2; see ./dev $1 --help"
}

# What follows an option, empty if nothing does; an option that is not in the help is refused.
option_value() {
    local name kind
    while read -r name kind _; do
        [[ $name == "$2" ]] || continue
        [[ ! $kind =~ ^[A-Z]+(,\.\.\.)?$ ]] || printf '%s\n' "$kind"
        return
    done <"$PARTS/help/$1.txt"
    refuse "$1" "there is no option $2"
}

take_value() {
    local command=$1 option=$2 kind=$3 value=$4
    case $kind in
        N | KIB | SECONDS) [[ $value =~ ^[0-9]+$ && $value != 0* ]] || refuse "$command" "'$value' is no whole number from 1 upwards" ;;
        LIST) [[ $value =~ ^[1-9][0-9]*(,[1-9][0-9]*)*$ ]] || refuse "$command" "'$value' is no list of numbers, such as 4,10" ;;
        FILE)
            value=$(as_called "$value")
            [[ -d $(dirname "$value") && -w $(dirname "$value") ]] ||
                fail "$command: nothing can be written to $value: there is no such folder that you may write to"
            ;;
        REPORT)
            value=$(as_called "$value")
            [[ -r $value ]] || fail "$command: there is no file $value"
            ;;
    esac
    ARGUMENTS+=("$option" "$value")
}

# A file's name from where one stands.
as_called() {
    [[ $1 == /* ]] && printf '%s\n' "$1" || printf '%s\n' "$CALLED_FROM/$1"
}

# Whether what follows the word is for another program. The word itself must be known, unless the help names none.
takes_rest() {
    case $1 in
        test | sanitize) knows_word "$1" "$2" ;;
        mutate | elsewhere) true ;;
        *) false ;;
    esac
}

knows_word() {
    grep -qE "^  $2( |\$)" "$PARTS/help/$1.txt" && [[ $2 =~ ^[a-z0-9_-]+$ ]]
}
