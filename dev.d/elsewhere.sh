# Any command in a fresh root of another release of Debian, made by debootstrap. In it works a plain user, who may
# become root with sudo, in a copy of the tree. The root becomes that of namespaces of its own by pivot_root: in a
# chroot the kernel makes no user namespaces, which the boxes are made of.

readonly ELSEWHERE=$PWD/build/elsewhere

run_elsewhere() {
    release=${1:-} keeps='' as_root=()
    [[ $release != --keep ]] || { keeps=yes; shift; release=${1:-}; }
    [[ $release =~ ^[a-z]+$ ]] || refuse elsewhere "it needs the name of a release, such as bookworm or trixie"
    shift
    require_git
    require_space 3000
    if ((EUID)); then
        command -v sudo >/dev/null || fail "this must be root to make a root, and there is no sudo"
        as_root=(sudo)
    fi
    need_packages elsewhere
    [[ -e /usr/share/debootstrap/scripts/$release ]] || fail "debootstrap knows no release '$release'"
    make_base
    trap leave_root EXIT
    make_root
    copy_tree
    enter_root "$@"
}

# The release's bare minimum, made once and kept as an archive.
make_base() {
    local fresh=$ELSEWHERE/$release.new
    [[ ! -e $ELSEWHERE/$release.tar ]] || return 0
    echo "Making a root of $release from some 80 MB of packages ..."
    mkdir -p "$ELSEWHERE/$release.debs"
    "${as_root[@]}" rm -rf "$fresh"
    narrate "making the root" "${as_root[@]}" debootstrap --variant=minbase --include=ca-certificates,sudo \
        "$release" "$fresh" >"$ELSEWHERE/$release.log" ||
        fail "debootstrap failed: $(grep '^E:' "$ELSEWHERE/$release.log" | head -n 1); see $ELSEWHERE/$release.log"
    "${as_root[@]}" tar -C "$fresh" --exclude=./var/cache/apt/archives/*.deb -c . >"$ELSEWHERE/$release.tar.new"
    mv "$ELSEWHERE/$release.tar.new" "$ELSEWHERE/$release.tar"
    "${as_root[@]}" rm -rf "$fresh"
}

# Unpacks the archive, unless the root of the last run was kept.
make_root() {
    root=$ELSEWHERE/$release.root
    [[ -z $keeps || ! -d $root/home/guest ]] || return 0
    "${as_root[@]}" rm -rf "$root"
    "${as_root[@]}" mkdir -p "$root"
    "${as_root[@]}" tar -C "$root" -x <"$ELSEWHERE/$release.tar"
    "${as_root[@]}" chroot "$root" sh -c '
        useradd --create-home --shell /bin/bash guest
        echo "guest ALL=(ALL) NOPASSWD: ALL" >/etc/sudoers.d/guest'
}

# As a clone of somebody's who has changed the same files; what was built in a root that was kept stays.
copy_tree() {
    local copy home=$root/home/guest
    copy=$(mktemp -d)
    git clone --quiet --no-hardlinks . "$copy/velks"
    git ls-files -z | (cd "$copy/velks" && xargs -0 rm -f)
    export_tree "$copy/velks"
    "${as_root[@]}" mkdir -p "$home/velks"
    "${as_root[@]}" find "$home/velks" -mindepth 1 -maxdepth 1 ! -name build -exec rm -rf {} +
    "${as_root[@]}" cp -a "$copy/velks/." "$home/velks"
    "${as_root[@]}" chroot "$root" chown -R guest: /home/guest
    rm -rf "$copy"
}

enter_root() {
    "${as_root[@]}" unshare --mount --pid --ipc --uts --fork --kill-child \
        "$PARTS/enter-root" "$root" "$ELSEWHERE/$release.debs" "$@"
}

# However the command ended.
leave_root() {
    "${as_root[@]}" chown -R "$(id -u):$(id -g)" "$ELSEWHERE/$release.debs"
    [[ -n $keeps ]] || "${as_root[@]}" rm -rf "$root"
}
