# shellcheck shell=bash
# A bare Debian with the package beside it, for the scripts that source this: a root of its own, with mounts, processes and
# network of its own. What is bare of it is made once, in build/package. Needs root, and a mirror of Debian where packages
# are not in apt's cache.
: "${source_dir:?}"

# begin_bare_root FOLDER: in FOLDER/root.
begin_bare_root() {
    local bare=$source_dir/build/package/bare
    ((EUID == 0)) || die "needs root"
    mkdir -p "$source_dir/build/package"
    [[ -d $bare ]] || make_bare_root "$bare"
    mkdir "$1"/{root,changes,scratch}
    furnish "$1/changes"
    if ! mount -t overlay overlay -o "lowerdir=$bare,upperdir=$1/changes,workdir=$1/scratch" "$1/root" 2>/dev/null; then
        cp -a "$bare/." "$1/root"
        mount --bind "$1/root" "$1/root"
        cp -a "$1/changes/." "$1/root"
    fi
}

end_bare_root() {
    umount -l "$1/root" 2>/dev/null || true
}

# make_bare_root DIR: of the release that this machine runs, for the package is for that one.
make_bare_root() {
    local mirror
    # shellcheck disable=SC1091
    VERSION_CODENAME=$(. /etc/os-release && printf '%s' "$VERSION_CODENAME")
    # shellcheck disable=SC2016 # it is apt that expands this
    mirror=$(apt-get indextargets --format '$(REPO_URI)' "Codename: $VERSION_CODENAME" | head -n 1)
    [[ -n $mirror ]] || die "apt knows no mirror for $VERSION_CODENAME"
    debootstrap --variant=minbase "$VERSION_CODENAME" "$1.new" "$mirror" >"$1.log" || die "no bare root; see $1.log"
    rm -rf "$1.new"/var/cache/apt/archives/*.deb "$1.new"/etc/apt
    mv "$1.new" "$1"
}

# furnish DIR: what apt needs of this machine, so that nothing is fetched twice; and that no service is started early.
furnish() {
    mkdir -p "$1"/{etc,usr/sbin,var/lib/apt,var/cache/apt/archives,package}
    cp -a /etc/apt /etc/ssl /etc/resolv.conf "$1/etc/" 2>/dev/null || true
    rm -f "$1"/etc/apt/apt.conf.d/*docker*
    cp -a /var/lib/apt/lists "$1/var/lib/apt/"
    cp -al /var/cache/apt/archives/*.deb "$1/var/cache/apt/archives/" 2>/dev/null || true
    printf '127.0.0.1 localhost\n' >"$1/etc/hosts"
    printf '#!/bin/sh\nexit 101\n' >"$1/usr/sbin/policy-rc.d"
    chmod 755 "$1/usr/sbin/policy-rc.d"
    cp "$source_dir"/build/package/ventrasagent_*.deb "$1/package/"
    cp "$source_dir/build/release/tests/parts/libventras-no-avahi.so" "$1/package/"
}

# enter ROOT NETWORK PROGRAM [ARGUMENT...]: NETWORK is "online", or "apart" for one of its own.
enter() {
    local -a apart=()
    [[ $2 == online ]] || apart=(-n)
    # shellcheck disable=SC2016 # it is the inner shell that expands this
    unshare -m -p -f --kill-child "${apart[@]}" bash -euc '
        [[ $2 == online ]] || ip link set lo up
        mount -t proc proc "$1/proc"
        mount --rbind /dev "$1/dev"
        mount --rbind /sys "$1/sys"
        mkdir -p "$1/.outside"
        cd "$1"
        pivot_root . .outside
        umount -l /.outside
        exec env -i PATH=/usr/local/sbin:/usr/local/bin:/usr/sbin:/usr/bin:/sbin:/bin HOME=/root LANG=C.UTF-8 \
            DEBIAN_FRONTEND=noninteractive "${@:3}"' _ "$@"
}
