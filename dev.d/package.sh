# The Debian package.

# Copies the tree as a commit would record it: without ignored files, and with git's file modes.
export_tree() {
    git ls-files -z --cached --others --exclude-standard | while IFS= read -r -d '' file; do
        [[ ! -e $file ]] || printf '%s\0' "$file" # deleted, but not yet for git
    done | tar -c --null --files-from=- --mode=u=rwX,go=rX | tar -x -p -C "$1"
}

run_package() {
    local folder=build/package
    require_git
    require_plain_path
    require_space 300
    need_packages build package
    rm -rf "$folder"
    mkdir -p "$folder/velk-session-agent"
    export_tree "$folder/velk-session-agent"
    narrate "building the package" build_package "$folder/velk-session-agent"
    # Suppresses what lintian reports differently on each release: the current version of Debian's policy, and functions
    # that could be checked at run time, though debian/rules enables all hardening.
    narrate "lintian" lintian --pedantic --fail-on error,warning,info,pedantic --display-info --suppress-tags \
        out-of-date-standards-version,newer-standards-version,hardening-no-fortify-functions "$folder"/*.changes
    (cd "$folder" && sha256sum ./*.deb ./*.dsc ./*.tar.*)
}

# Runs in the given folder, with further arguments for dpkg-buildpackage. Locale, umask and time zone are fixed, so that
# the same commit gives the same bytes.
build_package() {
    cd "$1" || return
    shift
    umask 022
    LC_ALL=C.UTF-8 TZ=UTC dpkg-buildpackage --unsigned-source --unsigned-changes --jobs="$(nproc)" "$@"
}
