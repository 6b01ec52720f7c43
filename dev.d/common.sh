# Output that all commands share.

readonly LONGEST_SILENCE=8 # seconds

# With the exit status, 1 without one.
fail() {
    printf 'dev: %s\n' "$1" >&2
    exit "${2:-1}"
}

# Runs a command and passes its output on; after some seconds of silence, prints that the command is still running.
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
    trap '' INT TERM # reads on until the command has ended
    while true; do
        status=0
        IFS= read -t "$LONGEST_SILENCE" -r line || status=$?
        if ((status == 0)); then
            printf '%s\n' "$line"
        elif ((status > 128)); then # timed out; print the partial line first
            printf '%s\n' "$line${line:+ }... $words continues ($((SECONDS - begin)) s)"
        else
            printf '%s' "$line"
            return
        fi
    done
}

# Runs a command that prints steps, lines that begin with "[12/56]" or "[ 12 %]". On a terminal each step replaces the
# one before; in a file one is printed every few seconds. Other lines are passed on.
show_steps() {
    local statuses
    set +e
    "$@" 2>&1 | print_steps
    statuses=("${PIPESTATUS[@]}")
    set -e
    return "${statuses[0]}"
}

print_steps() {
    local line='' last='' status=0 printed=$((SECONDS - LONGEST_SILENCE)) step='^\[ *[0-9]+(/[0-9]+| %)\] '
    trap '' INT TERM
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

# A terminal shows each step, a file one every few seconds.
show_step() {
    if is_terminal; then
        printf '\r\033[K%s' "${last:0:$(($(tput cols 2>/dev/null || echo 80) - 1))}"
    elif ((SECONDS - printed >= LONGEST_SILENCE - 2)) && [[ -n $last ]]; then
        printf '%s\n' "$last"
        printed=$SECONDS
    fi
}

clear_step() {
    ! is_terminal || printf '\r\033[K'
}

# One that can clear a line.
is_terminal() {
    [[ -t 1 && ${TERM:-dumb} != dumb ]]
}
