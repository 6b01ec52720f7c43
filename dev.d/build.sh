# Builds the programs that a command needs, and no others.

readonly AGENT=$PWD/build/$PRESET/src/velks

# Builds the given targets; without one, everything.
build() {
    local targets=() target
    for target in "$@"; do targets+=(--target "$target"); done
    configure "$PRESET"
    show_steps cmake --build --preset "$PRESET" "${targets[@]}" ||
        fail "the build failed; see the messages above"
}

# A failed or unfinished configuration leaves no build.ninja.
configure() {
    [[ ! -f build/$1/build.ninja ]] || return 0
    echo "Preparing the build in build/$1 ..."
    mkdir -p build
    cmake --preset "$1" "${@:2}" -DCMAKE_CXX_COMPILER_LAUNCHER=ccache >"build/$1.log" 2>&1 || {
        tail -n 30 "build/$1.log" >&2
        fail "the build could not be prepared; see the messages above or build/$1.log"
    }
}

run_setup() {
    need_packages "$@"
    echo "All packages are installed."
}

run_build() {
    require_space 100
    need_packages build terminal
    build
}
