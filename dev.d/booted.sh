# The tests on a machine that really boots. They need root, a kernel that lets them mount, and some seven minutes, so
# `./dev test` alone does not run them.

# Machines at a time: the tests mostly wait, one of them for five minutes.
readonly BOOTED_JOBS=3

run_booted_tests() {
    local as_root=() missing=(systemd-container) folder=build/booted
    ((EUID == 0)) || as_root=(sudo)
    require_git
    require_plain_path
    require_sudo
    require_machines
    require_space 500
    need_packages build package tests booted
    require_pytest_arguments "$@"
    build_booted_package
    trap forget_machines EXIT
    # In namespaces of their own, all processes and mounts end with the tests. sudo passes no variables on.
    narrate "testing" "${as_root[@]}" env PYTHONDONTWRITEBYTECODE=1 \
        VELK_BOOTED_ROOT="${VELK_BOOTED_ROOT:-/}" VELK_PACKAGE="$(echo "$PWD/$folder"/velk-session-agent_*.deb)" \
        unshare --mount --pid --fork --kill-child --mount-proc \
        "$PYTHON" -m pytest -p no:cacheprovider "$(colour)" -n "$BOOTED_JOBS" \
        --confcutdir tests/booted tests/booted "$@"
}

# Machines whose tests were interrupted leave empty control groups, and folders that were mount points.
forget_machines() {
    local group
    for group in /sys/fs/cgroup/{,unified/}velks-booted-*; do
        grep -qs 'populated 0' "$group/cgroup.events" || continue
        "${as_root[@]}" find "$group" -depth -type d -exec rmdir {} +
        "${as_root[@]}" rmdir "/run/velks-booted/${group##*/velks-booted-}"
    done
}

require_machines() {
    local trouble
    trouble=$("${as_root[@]}" tests/booted/can-boot 2>&1) || fail "$trouble"
}

# Like ./dev package, but builds only the binary package, without checks, and with the compiler cache.
build_booted_package() {
    rm -rf "$folder"
    mkdir -p "$folder/velk-session-agent"
    export_tree "$folder/velk-session-agent"
    PATH=/usr/lib/ccache:$PATH DEB_BUILD_OPTIONS="noautodbgsym parallel=$(nproc)" \
        narrate "building the package" build_package "$folder/velk-session-agent" --build=binary
}
