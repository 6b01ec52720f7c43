# Checks a command's arguments before anything else runs. The command's help defines them. A line that begins with two
# blanks and a word names an option, with its value, or another argument; a line that begins with more blanks and a
# number names a scene.

readonly WRONG_ARGUMENTS=2 # exit status, as of most programs

# Checks variables of the environment like arguments.
read_variables() {
    local presets
    presets=$(sed -n 's/.*{"name": "\([^"]*\)", "configurePreset".*/\1/p' CMakePresets.json)
    grep -qxF -- "$PRESET" <<<"$presets" ||
        fail "VELK_PRESET: there is no preset '$PRESET'; there are: ${presets//$'\n'/, }" "$WRONG_ARGUMENTS"
    is_number "$TEST_JOBS" || fail "VELK_TEST_JOBS: '$TEST_JOBS' is not a whole number of at least 1" "$WRONG_ARGUMENTS"
}

# Fills ARGUMENTS with the words after the command; makes file names absolute, since ./dev works at its root.
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
                [[ $command != mutate ]] || word=${word##*/}
                knows_word "$command" "$word" || refuse "$command" "there is no '$word' here"
                ARGUMENTS+=("$word")
                if takes_rest "$command"; then
                    [[ ! ${1:-} =~ ^(-h|--help)$ ]] || exec cat "$PARTS/help/$command.txt"
                    ARGUMENTS+=("$@")
                    return
                fi
                ;;
        esac
    done
}

refuse() {
    fail "$1: $2; see ./dev $1 --help" "$WRONG_ARGUMENTS"
}

# The kind of an option's value, empty if it takes none; refuses an option that is not in the help.
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
        N | KIB | SECONDS) is_number "$value" || refuse "$command" "'$value' is not a whole number of at least 1" ;;
        COUNT) [[ $value == 0 ]] || is_number "$value" || refuse "$command" "'$value' is not a whole number" ;;
        SCENES) require_scenes "$command" "$value" ;;
        FILE)
            value=$(as_called "$value")
            require_writable "$command" "$value"
            ;;
        FIGURES) # those of other groups in the file are kept
            value=$(as_called "$value")
            require_writable "$command" "$value"
            [[ ! -e $value ]] || require_report "$command" "$value"
            ;;
        REPORT)
            value=$(as_called "$value")
            require_report "$command" "$value"
            ;;
    esac
    ARGUMENTS+=("$option" "$value")
}

is_number() {
    [[ $1 =~ ^[1-9][0-9]*$ ]]
}

require_scenes() {
    local number
    [[ $2 =~ ^[1-9][0-9]*(,[1-9][0-9]*)*$ ]] || refuse "$1" "'$2' is not a list of numbers, such as 4,10"
    for number in ${2//,/ }; do
        grep -qE "^ {3,}$number  " "$PARTS/help/$1.txt" || refuse "$1" "there is no scene $number"
    done
}

require_writable() {
    local folder
    folder=$(dirname "$2")
    [[ -d $folder && -w $folder ]] ||
        fail "$1: $2 cannot be written: its folder does not exist or is not writable" "$WRONG_ARGUMENTS"
    [[ ! -d $2 ]] || fail "$1: $2 cannot be written: it is a folder" "$WRONG_ARGUMENTS"
}

require_report() {
    [[ -e $2 ]] || fail "$1: there is no file $2" "$WRONG_ARGUMENTS"
    grep -qs '"figures": ' "$2" || fail "$1: $2 is not a report of a run, or you may not read it" "$WRONG_ARGUMENTS"
}

# A file name relative to the caller's folder.
as_called() {
    [[ $1 == /* ]] && printf '%s\n' "$1" || printf '%s\n' "$CALLED_FROM/$1"
}

# Whether the words after the first one are for another program.
takes_rest() {
    [[ $1 =~ ^(test|sanitize|elsewhere)$ ]]
}

knows_word() {
    [[ $2 =~ ^[a-z0-9_.-]+$ ]] && grep -qE "^  ${2//./\\.}( |\$)" "$PARTS/help/$1.txt"
}
