# Preconditions of installing and building. Each failure is one line that says what to do.

# The build must run as the tree's owner: files of root would block the owner's next command.
require_owner() {
    local owner
    owner=$(stat -c %U .)
    if ((EUID == 0)) && [[ $owner != root ]]; then
        fail "this folder belongs to $owner; run ./dev as $owner, it asks for sudo itself where that is needed"
    fi
    [[ -w . ]] || fail "this folder belongs to $owner and you may not write to it; make a clone of your own"
}

# The box needs user namespaces.
require_boxes() {
    local trouble
    trouble=$(sandbox/can-box 2>&1) || fail "$trouble"
}

require_git() {
    local answer
    if ! command -v git >/dev/null; then
        [[ -e .git ]] || fail "this is not a git clone, and this command works on what git lists"
        return 0 # it will be installed
    fi
    answer=$(LC_ALL=C git ls-files 2>&1 >/dev/null) || fail "git lists no sources here: ${answer%%$'\n'*}"
}

# The build tools of Debian packages split their flags at blanks.
require_plain_path() {
    [[ $PWD != *[[:space:]]* ]] ||
        fail "Debian's package tools cannot work in a folder with a blank in its name: $PWD"
}

require_space() {
    local wanted=$1 free
    free=$(df --output=avail --block-size=1M . | tail -n 1)
    ((free >= wanted)) || fail "this needs about $wanted MB in $PWD/build, and only ${free// /} MB are free there"
}
