# Runs any command in a fresh root of another Debian release, made by debootstrap, as an ordinary user who may use sudo,
# in a copy of the tree. The root is entered by pivot_root in namespaces of its own: in a chroot the kernel allows no
# user namespaces, which the boxes need.

readonly ELSEWHERE=$PWD/build/elsewhere

run_elsewhere() {
    release=${1:-} throws_away=yes as_root=()
    [[ $release != --keep ]] || { throws_away=''; shift; release=${1:-}; }
    [[ -n $release ]] || refuse elsewhere "it needs the name of a release, such as bookworm or trixie"
    shift
    require_git
    require_space 3000
    if ((EUID)); then
        command -v sudo >/dev/null || fail "this must be root to make a root, and there is no sudo"
        sudo true || fail "this must be root to make a root, and sudo refuses"
        as_root=(sudo)
    fi
    need_packages elsewhere
    root=$ELSEWHERE/$release.root
    mkdir -p "$ELSEWHERE/$release.debs"
    trap leave_root EXIT
    make_base
    make_root
    copy_tree
    enter_root "$@"
}

# The release's minimal system, built once and kept as an archive.
make_base() {
    [[ ! -e $ELSEWHERE/$release.tar ]] || return 0
    echo "Making a root of $release from some 80 MB of packages ..."
    "${as_root[@]}" rm -rf "$ELSEWHERE/$release.new"
    narrate "making the root" bootstrap ||
        fail "debootstrap failed: $(sed -n 's/^E: //p' "$ELSEWHERE/$release.log" | head -n 1); see $ELSEWHERE/$release.log"
    mv "$ELSEWHERE/$release.tar.new" "$ELSEWHERE/$release.tar"
}

# What debootstrap mounts ends with it.
bootstrap() {
    "${as_root[@]}" unshare --mount debootstrap --variant=minbase --include=ca-certificates,sudo \
        "$release" "$ELSEWHERE/$release.new" >"$ELSEWHERE/$release.log" &&
        "${as_root[@]}" tar -C "$ELSEWHERE/$release.new" --exclude=./var/cache/apt/archives/*.deb -c . \
            >"$ELSEWHERE/$release.tar.new"
}

# Unpacks the archive, unless the root of the last run was kept.
make_root() {
    [[ -n $throws_away || ! -d $root/home/guest ]] || return 0
    "${as_root[@]}" rm -rf "$root"
    "${as_root[@]}" mkdir -p "$root"
    "${as_root[@]}" tar -C "$root" -x <"$ELSEWHERE/$release.tar"
    "${as_root[@]}" chroot "$root" sh -c '
        useradd --create-home --shell /bin/bash guest
        echo "guest ALL=(ALL) NOPASSWD: ALL" >/etc/sudoers.d/guest'
}

# Copies the tree as a clone with the same changes as here; a kept root keeps its builds.
copy_tree() {
    local copy=$ELSEWHERE/$release.copy home=$root/home/guest
    rm -rf "$copy"
    git clone --quiet --no-hardlinks . "$copy"
    git ls-files -z | (cd "$copy" && xargs -0 rm -f)
    export_tree "$copy"
    "${as_root[@]}" mkdir -p "$home/velks"
    "${as_root[@]}" find "$home/velks" -mindepth 1 -maxdepth 1 ! -name build -exec rm -rf {} +
    "${as_root[@]}" cp -a "$copy/." "$home/velks"
    "${as_root[@]}" chroot "$root" chown -R guest: /home/guest
}

enter_root() {
    "${as_root[@]}" unshare --mount --pid --ipc --uts --fork --kill-child \
        "$PARTS/enter-root" "$root" "$ELSEWHERE/$release.debs" "$@"
}

# Runs however the command ended.
leave_root() {
    "${as_root[@]}" chown -R "$(id -u):$(id -g)" "$ELSEWHERE/$release.debs"
    narrate "tidying up" "${as_root[@]}" rm -rf "$ELSEWHERE/$release".{new,tar.new,copy} ${throws_away:+"$root"}
}
