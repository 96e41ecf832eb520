# shellcheck shell=bash
# What the machine has to have: scripts/packages says what, apt installs it.
: "${source_dir:?}"

die() {
    printf '%s: %s\n' "${0##*/}" "$*" >&2
    exit 1
}

# packages_of SECTION...: the packages that scripts/packages lists under these headings.
packages_of() {
    local section
    for section; do
        awk -v wanted="[$section]" '/^\[/ { inside = ($0 == wanted) } inside && /^[^[#]/ { print $1 }' \
            "$source_dir/scripts/packages"
    done
}

# missing_of PACKAGE...: those that are not installed.
missing_of() {
    comm -23 <(printf '%s\n' "$@" | sort -u) \
        <(dpkg-query -W -f='${db:Status-Status} ${Package}\n' | sed -n 's/^installed //p' | sort -u)
}

as_root() {
    if ((EUID == 0)); then
        "$@"
    elif command -v sudo >/dev/null; then
        sudo "$@"
    else
        die "there is no sudo here; as root, run: $*"
    fi
}

apt() {
    as_root env DEBIAN_FRONTEND=noninteractive apt-get -qq -o DPkg::Lock::Timeout=300 "$@"
}

# install_missing SECTION...: asks nothing, and leaves apt alone when everything is there.
install_missing() {
    command -v dpkg-query >/dev/null || die "this script knows Debian and Ubuntu only; scripts/packages lists what is needed"
    local -a wanted missing
    mapfile -t wanted < <(packages_of "$@")
    mapfile -t missing < <(missing_of "${wanted[@]}")
    ((${#missing[@]})) || return 0
    printf 'Installing %d packages: %s\n' "${#missing[@]}" "${missing[*]}" >&2
    apt update || printf 'The package lists could not be renewed; going on with those at hand.\n' >&2
    apt install -y --no-install-recommends "${missing[@]}" </dev/null >&2 || die "apt could not install: ${missing[*]}"
}
