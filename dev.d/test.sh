# The tests, layer by layer.

readonly LEAST_COVERAGE=95 # per cent of the lines
# Exit statuses of pytest.
readonly PYTEST_REFUSES=4
readonly PYTEST_CHOSE_NONE=5

run_test() {
    local layer=${1:-all}
    (($#)) && shift
    if [[ $layer == booted ]]; then
        run_booted_tests "$@"
        return
    fi
    require_boxes
    require_space 1000
    need_packages build terminal tests
    [[ $layer == unit ]] || require_pytest_arguments "$@"
    case $layer in
        unit) build_unit_tests "$@" ;;
        all) build ;;
        *) build velks velks-check ;;
    esac
    case $layer in
        unit) run_unit_tests "$@" ;;
        dev) run_dev_tests "$@" ;;
        bench | contracts) run_pytest_as domain "tests/$layer" "$@" ;; # none depends on the user
        sandbox | e2e) run_for_each_user "tests/$layer" "$@" ;;
        all) run_all_layers ;;
    esac
}

# Has pytest read its arguments and do nothing else.
require_pytest_arguments() {
    local trouble status=0
    (($#)) || return 0
    trouble=$("$PYTHON" -m pytest --noconftest --version "$@" 2>&1 >/dev/null) || status=$?
    ((status != PYTEST_REFUSES)) ||
        fail "test: $(sed -n 's/.*error: //p' <<<"$trouble"); see $PYTHON -m pytest --help" "$WRONG_ARGUMENTS"
}

# Runs all layers, even if one fails.
run_all_layers() {
    local failed=()
    run_unit_tests || failed+=(unit)
    run_dev_tests || failed+=(dev)
    run_pytest_as domain tests/bench tests/contracts tests/sandbox tests/e2e || failed+=("the domain user's")
    run_pytest_as local tests/sandbox tests/e2e || failed+=("the local user's")
    ((${#failed[@]} == 0)) || fail "these tests failed: $(join_words "${failed[@]}"); see the messages above"
    echo "All layers passed."
}

join_words() {
    local IFS=,
    printf '%s\n' "${*//,/, }" | sed 's/,/, /g'
}

# Each test is named after its program, so a selection needs no other program. Of a selection that ctest does not
# understand, or that is empty, nothing is built: ctest reports it.
build_unit_tests() {
    local programs=()
    configure "$PRESET"
    if (($#)); then
        mapfile -t programs < <(ctest --test-dir "build/$PRESET" --show-only "$@" 2>/dev/null |
            sed -n 's/^ *Test *#[0-9]*: \([^ ]*\).*/\1/p')
        ((${#programs[@]})) || return 0
    fi
    build "${programs[@]}"
}

run_unit_tests() {
    narrate "running unit tests" ctest --test-dir "build/$PRESET" --parallel "$TEST_JOBS" \
        --output-on-failure --no-tests=error "$@"
}

# Tests ./dev itself, in copies of its parts and with fakes of the programs that it calls.
run_dev_tests() {
    narrate "testing ./dev" "$PYTHON" -m pytest -p no:cacheprovider "$(colour)" \
        -n "$TEST_JOBS" -p tests.dev.devtree --confcutdir tests/dev tests/dev "$@"
}

# Each worker runs in its own box, with its own file system view, buses and user.
run_pytest_as() {
    local user=$1
    shift
    VELK_BOX_USER=$user VELK_AGENT=$AGENT narrate "testing" \
        "$PYTHON" -m pytest -p no:cacheprovider "$(colour)" --dist load \
        --tx "$TEST_JOBS*popen//python=sandbox/in-box-python" "$@"
}

colour() {
    if is_terminal; then echo --color=yes; else echo --color=no; fi
}

# Runs the layer's tests for a domain user, then for a local user. A selection may leave one of them without tests.
run_for_each_user() {
    local user status worst=0 without=0
    for user in domain local; do
        status=0
        run_pytest_as "$user" "$@" || status=$?
        case $status in
            0) ;;
            "$PYTEST_CHOSE_NONE") without=$((without + 1)) ;;
            *) worst=$status ;;
        esac
    done
    ((without < 2)) || fail "no test was selected"
    return "$worst"
}

run_sanitize() {
    local kind=${1:-address}
    (($#)) && shift
    case $kind in
        address)
            # Returning memory reads the time, which deadlocks under the tests' preloaded clock; a full quarantine must
            # not look like a leak.
            export ASAN_OPTIONS=allocator_release_to_os_interval_ms=-1:quarantine_size_mb=16
            export LSAN_OPTIONS="print_suppressions=0 suppressions=$PWD/tests/sanitizers/leak.supp"
            VELK_PRESET=asan-ubsan exec ./dev test "$@"
            ;;
        thread)
            export TSAN_OPTIONS="ignore_noninstrumented_modules=1 suppressions=$PWD/tests/sanitizers/thread.supp"
            VELK_PRESET=tsan exec ./dev test unit "$@"
            ;;
        memory)
            read_arguments soak "$@"
            run_memcheck "${ARGUMENTS[@]}"
            ;;
    esac
}

# Runs a session under valgrind, which finds leaks and misuse; the memory growth measured there is meaningless.
run_memcheck() {
    local logs=build/memcheck
    require_boxes
    need_packages build terminal soak bench
    build velks
    rm -rf "$logs"
    mkdir -p "$logs"
    VELK_AGENT=$PWD/tests/sanitizers/memcheck-agent narrate "running a session under valgrind" \
        "$PYTHON" -m sandbox soak --hours 2 --allowance 1000000 "$@"
    # A child that has not yet called exec leaves a log without a summary.
    if grep -l 'ERROR SUMMARY: [1-9]' "$logs"/*.log; then
        fail "valgrind found something; see the logs above"
    fi
    grep -q 'ERROR SUMMARY: 0 errors' "$logs"/*.log || fail "no agent ran under valgrind"
    echo "memory: nothing lost, nothing misused"
}

run_coverage() {
    local report=build/coverage/report status=0
    require_boxes
    need_packages build terminal tests coverage
    VELK_PRESET=coverage ./dev build
    find build/coverage -name '*.gcda' -delete # counters of an earlier run
    VELK_PRESET=coverage ./dev test || status=$?
    mkdir -p "$report"
    narrate "writing the report" gcovr --root . --object-directory build/coverage --filter src/ \
        --filter platform/ --exclude-throw-branches --print-summary --txt --html-details "$report/index.html" \
        --fail-under-line "$LEAST_COVERAGE"
    echo "coverage: line by line in $report/index.html"
    return "$status"
}
