# The tree's programs other than tests: for people at a terminal, for measuring and for searching.

run_demo() { run_in_terminal demo "$@"; }
run_box() { run_in_terminal box "$@"; }
run_soak() { run_in_terminal soak "$@"; }
run_picture() { run_in_terminal demo --svg "$PWD/docs/demo.svg" --only 10 "$@"; }

# Only the program writes to standard output; the preparations use standard error.
run_in_terminal() {
    local groups=(build terminal)
    [[ $1 != soak ]] || groups+=(soak)
    require_boxes
    require_space 100
    need_packages "${groups[@]}" >&2
    build velks >&2
    VELK_AGENT=$AGENT exec "$PYTHON" -m sandbox "$@"
}

run_bench() {
    local groups=(build terminal soak bench)
    [[ " $* " != *" --write-docs "* ]] || groups+=(plots)
    require_boxes
    need_packages "${groups[@]}"
    build velks velks-check bench_programs
    [[ " $* " != *" neighbours "* ]] || unpack_neighbours
    export VELK_AGENT=$AGENT
    # On a terminal it shows its progress itself.
    if [[ -t 1 ]]; then exec "$PYTHON" -m bench "$@"; fi
    narrate "measuring" "$PYTHON" -m bench "$@"
}

# Builds in its own copies of the tree.
run_mutate() {
    require_boxes
    require_git
    require_space 1000
    need_packages build terminal tests
    narrate "trying mutants" "$PYTHON" -m tests.mutation.mutate "$@"
}

run_fuzz() {
    require_boxes
    require_space 400
    need_packages build terminal fuzz
    configure fuzz
    show_steps cmake --build --preset fuzz || fail "the build failed; see the messages above"
    narrate "fuzzing" "$PYTHON" -m tests.fuzz.run "$@"
}
