# What all commands say and how they say it.

readonly LONGEST_SILENCE=8 # seconds

fail() {
    printf 'dev: %s\n' "$1" >&2
    exit 1
}

# Runs a command and passes on what it says; after some seconds of silence, says that it still goes on.
narrate() {
    local words=$1 statuses
    shift
    set +e
    "$@" 2>&1 | keep_company "$words"
    statuses=("${PIPESTATUS[@]}")
    set -e
    return "${statuses[0]}"
}

keep_company() {
    local words=$1 line status begin=$SECONDS
    trap '' INT # reads on until the command has ended
    while true; do
        status=0
        IFS= read -t "$LONGEST_SILENCE" -r line || status=$?
        if ((status == 0)); then
            printf '%s\n' "$line"
        elif ((status > 128)); then # time is up; what there is of a line comes first
            printf '%s\n' "$line${line:+ }... $words goes on ($((SECONDS - begin)) s)"
        else
            printf '%s' "$line"
            return
        fi
    done
}

# Runs a command whose steps are lines that begin with "[12/56]" or "[ 12 %]": on a terminal they take turns in one
# line; in a file there is one every few seconds. Other lines are passed on.
show_steps() {
    local statuses
    set +e
    "$@" 2>&1 | print_steps
    statuses=("${PIPESTATUS[@]}")
    set -e
    return "${statuses[0]}"
}

print_steps() {
    local line='' last='' status=0 told=$((SECONDS - LONGEST_SILENCE)) step='^\[ *[0-9]+(/[0-9]+| %)\] '
    trap '' INT
    while ((status == 0 || status > 128)); do
        status=0
        IFS= read -t "$LONGEST_SILENCE" -r line || status=$?
        if [[ $line =~ $step ]]; then
            last=$line
        elif [[ -n $line ]]; then
            clear_step
            printf '%s\n' "$line"
            continue
        fi
        show_step
    done
    clear_step
}

# A person sees each step in its turn, a file one every few seconds.
show_step() {
    if [[ -t 1 ]]; then
        printf '\r\033[K%s' "${last:0:$(($(tput cols 2>/dev/null || echo 80) - 1))}"
    elif ((SECONDS - told >= LONGEST_SILENCE - 2)) && [[ -n $last ]]; then
        printf '%s\n' "$last"
        told=$SECONDS
    fi
}

clear_step() {
    [[ ! -t 1 ]] || printf '\r\033[K'
}
