# shellcheck shell=bash
# A virtual machine with Debian's kernel, for the scripts that source this. Its root file system is a folder of this machine
# under an overlay that lives in memory: every program and library is there, and nothing that a test does can reach this
# machine. It has no network.
: "${source_dir:?}"

# What the guest's init loads; modules.dep says what these need in turn.
readonly modules=(virtio_pci 9pnet_virtio 9p overlay vhci-hcd usblp)
readonly kernel=$source_dir/build/kernel

work=    # what is only needed meanwhile
machine= # the process

filter='*'
acceleration=
programs=

# take_arguments ARGUMENT...: those of the scripts, [--filter FILTER] [--accel kvm|tcg] PROGRAM-FOLDER
# shellcheck disable=SC2034 # they are for the scripts
take_arguments() {
    while (($# > 1)); do
        case $1 in
            --filter) filter=$2 ;;
            --accel) acceleration=$2 ;;
            *) break ;;
        esac
        shift 2
    done
    if [[ $# -ne 1 || ! $acceleration =~ ^(kvm|tcg)?$ ]]; then
        printf 'Usage: %s [--filter FILTER] [--accel kvm|tcg] PROGRAM-FOLDER\n' "${0##*/}" >&2
        exit 2
    fi
    programs=$1
}

# begin_machine FOLDER: FOLDER is where the work is done, and goes with the script, whichever way that ends.
begin_machine() {
    [[ $(dpkg --print-architecture) == amd64 ]] || die "knows the kernel of amd64 only"
    work=$(mktemp -d "$1/ventras-machine.XXXXXXXX")
    trap end_machine EXIT
    trap 'exit 129' HUP
    trap 'exit 130' INT
    trap 'exit 143' TERM
    mkdir -p "$source_dir/build"
    [[ -d $kernel ]] || fetch_kernel
}

end_machine() {
    if [[ -n $machine ]]; then
        kill "$machine" 2>/dev/null || true
        wait "$machine" || true
    fi
    rm -rf --one-file-system "$work" "$kernel.new"
}

# Debian's package of the kernel that it recommends, unpacked: nothing is installed.
fetch_kernel() {
    local package release
    package=$(apt-cache depends linux-image-amd64 2>/dev/null | sed -n 's/^ *Depends: \(linux-image-.*\)/\1/p')
    if [[ -z $package ]]; then
        apt update || die "apt knows no linux-image-amd64, and its lists could not be renewed"
        package=$(apt-cache depends linux-image-amd64 | sed -n 's/^ *Depends: \(linux-image-.*\)/\1/p')
    fi
    printf 'Fetching %s\n' "$package" >&2
    (cd "$work" && apt-get -qq -o APT::Sandbox::User="$(id -un)" download "$package") || die "apt could not fetch $package"
    dpkg-deb -x "$work/$package"_*.deb "$work/package"
    rm "$work/$package"_*.deb
    release=${package#linux-image-}
    depmod -b "$work/package" "$release" || die "$package has no modules for $release"
    mkdir -p "$kernel.new/lib"
    mv "$work/package/lib/modules" "$kernel.new/lib/"
    unpack_vmlinux "$work/package/boot/vmlinuz-$release" >"$kernel.new/vmlinux"
    mv "$kernel.new" "$kernel"
}

# unpack_vmlinux VMLINUZ: the kernel proper, which boots seconds sooner than one that an emulated processor has to unpack.
unpack_vmlinux() {
    local offset
    offset=$(LC_ALL=C grep -aobP '\xFD7zXZ\x00' "$1" | head -n 1 | cut -d : -f 1)
    [[ -n $offset ]] || die "$1 holds no kernel packed with xz"
    xz -dc --single-stream < <(tail -c "+$((offset + 1))" "$1")
}

# make_initramfs START ARGUMENT...: busybox, init, the modules in the order in which they load, and what to start in the
# end: START with its arguments, one a line of a file.
make_initramfs() {
    local root=$work/initramfs release file
    release=$(basename "$kernel"/lib/modules/*)
    mkdir -p "$root"/{bin,modules,proc,sys,dev,host,changes,root}
    cp /bin/busybox "$root/bin/"
    cp "$source_dir/tests/kernel/init" "$root/"
    cp "$1" "$root/start"
    printf '%s\n' "${@:2}" >"$root/arguments"
    modprobe -C /dev/null -d "$kernel" -S "$release" -D -a "${modules[@]}" | awk '$1 == "insmod" && !seen[$2]++ { print $2 }' |
        while read -r file; do
            cp "$file" "$root/modules/"
            printf '%s\n' "${file##*/}"
        done >"$root/modules/order"
    (cd "$root" && find . | cpio --quiet -o -H newc -R 0:0) >"$work/initramfs.cpio"
}

# Whether KVM runs a processor, by two instructions of one: the device alone may be there where KVM fails later.
kvm_works() {
    local status
    [[ -r /dev/kvm && -w /dev/kvm ]] || return 1
    { # mov $0x15, %al; out %al, $0xf4; the signature of a boot sector
        printf '\xb0\x15\xe6\xf4'
        head -c 506 /dev/zero
        printf '\x55\xaa'
    } >"$work/boot"
    # In a shell of its own, for where it fails it aborts, and a shell remarks on that.
    status=$({
        ulimit -c 0
        timeout -k 1 10 qemu-system-x86_64 -accel kvm -cpu host -nodefaults -display none -m 16 -no-reboot \
            -device isa-debug-exit,iobase=0xf4,iosize=1 -drive "file=$work/boot,format=raw,if=floppy" </dev/null >&2
        printf %d $?
    } 2>/dev/null)
    ((status == 0x15 * 2 + 1))
}

# boot SECONDS ROOT [KERNEL-ARGUMENT...]: for so long at most. What the guest writes to its serial ports comes out here, but
# for the console and the status.
boot() {
    local seconds=$1 root=$2
    local -a processor=(-accel kvm -cpu host)
    if [[ $acceleration == tcg ]] || { [[ -z $acceleration ]] && ! kvm_works; }; then
        processor=(-accel tcg)
    fi
    timeout -k 10 "$seconds" qemu-system-x86_64 "${processor[@]}" -smp 2 -m 1024 -nodefaults -no-user-config -display none \
        -no-reboot -kernel "$kernel/vmlinux" -initrd "$work/initramfs.cpio" \
        -append "console=ttyS0 quiet panic=-1 nokaslr mitigations=off ${*:3}" \
        -virtfs "local,path=$root,mount_tag=host,readonly=on,security_model=none,multidevs=remap" \
        -serial "file:$work/console" -serial stdio -serial "file:$work/status" </dev/null &
    machine=$!
    wait "$machine" || printf '%s: the virtual machine ended with %d\n' "${0##*/}" $? >&2
    machine=
}

# Ends the script with the status that the tests in the guest had.
exit_as_guest() {
    local status
    status=$(tr -dc 0-9 <"$work/status")
    [[ $status == 0 ]] && exit
    printf '%s: %s; the last that the kernel said:\n' "${0##*/}" \
        "${status:+the tests ended with }${status:-the tests never told how they ended}" >&2
    tail -n 40 "$work/console" >&2
    exit "${status:-125}"
}
