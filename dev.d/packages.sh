# The Debian packages that a command needs, by the groups of packages.txt.

readonly APT_LOG=build/apt.log

# Package names in the given groups; without a group, in all but [booted], which changes how users log in,
# and [neighbours], which are not installed.
wanted_packages() {
    awk -v groups=" $* " '
        /^\[/ { group = substr($1, 2, length($1) - 2); next }
        /^[^#]/ && (groups == "  " && group != "booted" && group != "neighbours" || index(groups, " " group " ")) { print $1 }' packages.txt | sort -u
}

missing_packages() {
    local package
    for package in $(wanted_packages "$@"); do
        dpkg-query -W -f='${db:Status-Status}\n' "$package" 2>/dev/null | grep -qx installed ||
            printf '%s\n' "$package"
    done
}

need_packages() {
    command -v apt-get >/dev/null || fail "this needs Debian's apt-get; install the packages of packages.txt by hand"
    local missing as_root=()
    mapfile -t missing <<<"$(missing_packages "$@")"
    [[ -n ${missing[0]} ]] || return 0
    ((EUID == 0)) || as_root=(sudo)
    require_sudo
    mkdir -p build
    update_lists || fail "Debian's package lists could not be fetched: $(apt_error); is there a network?"
    tell_sizes
    install_missing || fail "the packages could not be installed: $(apt_error); see $APT_LOG"
}

# Asks for sudo's password, if it needs one, before any other output.
require_sudo() {
    local by_hand="as root, run: apt-get update && apt-get install --no-install-recommends ${missing[*]}"
    ((EUID)) || return 0
    command -v sudo >/dev/null || fail "packages are missing and there is no sudo; $by_hand"
    sudo true || fail "packages are missing and sudo refuses; $by_hand"
}

update_lists() {
    echo "Looking at Debian's package lists ..."
    narrate "fetching Debian's package lists" log_apt update
}

# Prints what will be installed, before it is.
tell_sizes() {
    local plan
    plan=$(run_apt --assume-no --no-install-recommends install "${missing[@]}" 2>&1 || true)
    printf 'Installing %s\n' "${missing[*]}" | fold -s -w 80
    sed -nE -e 's/.* ([0-9]+) newly installed.*/With all that they need: \1 packages/p' \
        -e 's/^Need to get ([^/]*)(\/.*)? of archives.*/To download: \1/p' \
        -e 's/^After this operation, (.*) of additional disk space.*/On the disk: \1/p' <<<"$plan"
}

# Shows apt's own progress as steps; its other output goes to the log.
install_missing() {
    show_steps apt_steps
}

apt_steps() {
    run_apt -y --no-install-recommends -o APT::Status-Fd=1 install "${missing[@]}" 2>&1 |
        sed -u -n -E -e '/^(dl|pm)status:[^:]*:([0-9]+)[.0-9]*:(.*)/ { s//[ \2 %] \3/p; d }' -e "w $APT_LOG"
}

log_apt() {
    run_apt "$@" >"$APT_LOG" 2>&1
}

run_apt() {
    "${as_root[@]}" env LC_ALL=C DEBIAN_FRONTEND=noninteractive \
        apt-get -o APT::Update::Error-Mode=any "$@" </dev/null
}

# The first error that apt printed.
apt_error() {
    sed -n 's/^[EW]: //p' "$APT_LOG" | head -n 1
}
