# The programs beside which ./dev bench neighbours measures the agent. They are unpacked under build/ and not installed:
# they would start with the desktop of the user who measures.

readonly NEIGHBOURS=$PWD/build/neighbours

# With the libraries that are not installed here.
unpack_neighbours() {
    local names
    [[ ! -f $NEIGHBOURS/versions ]] || return 0
    mapfile -t names <<<"$(wanted_with_libraries)"
    [[ -n ${names[0]} ]] || fail "apt-get does not find the neighbours; update its lists with: sudo apt-get update"
    echo "Fetching ${#names[@]} packages into build/neighbours, without installing them ..."
    rm -rf "$NEIGHBOURS"
    mkdir -p "$NEIGHBOURS/packages" "$NEIGHBOURS/root"
    (cd "$NEIGHBOURS/packages" && apt-get download "${names[@]}") >"$APT_LOG" 2>&1 ||
        fail "the neighbours could not be fetched: $(apt_error); is there a network?"
    unpack_each
}

wanted_with_libraries() {
    local wanted
    mapfile -t wanted <<<"$(wanted_packages neighbours)"
    LC_ALL=C apt-get --simulate --no-install-recommends --reinstall install "${wanted[@]}" 2>/dev/null |
        awk '$1 == "Inst" { print $2 }'
}

# The list of versions is written last: with it everything is there.
unpack_each() {
    local package schemas=$NEIGHBOURS/root/usr/share/glib-2.0/schemas
    for package in "$NEIGHBOURS"/packages/*.deb; do
        dpkg-deb --extract "$package" "$NEIGHBOURS/root"
    done
    "/usr/lib/$(dpkg-architecture -q DEB_HOST_MULTIARCH)/glib-2.0/glib-compile-schemas" "$schemas" 2>/dev/null
    for package in "$NEIGHBOURS"/packages/*.deb; do
        # shellcheck disable=SC2016 # the fields are for dpkg-deb
        dpkg-deb --show --showformat='${Package} ${Version}\n' "$package"
    done >"$NEIGHBOURS/versions"
}
