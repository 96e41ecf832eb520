# shellcheck shell=bash
# Configuring and building one CMake preset.
: "${source_dir:?}"

# build_preset PRESET [TARGET...]: everything of the preset, or just these targets.
build_preset() {
    local preset=$1
    shift
    cd "$source_dir" || die "cannot enter $source_dir"
    cmake --preset "$preset" --log-level=WARNING >&2 || die "preset $preset could not be configured"
    cmake --build --preset "$preset" ${1:+--target "$@"} >&2 || die "preset $preset did not build"
}

# test_preset PRESET [ARG...]: every test of the preset; arguments go to ctest. Four at a time for each processor: they wait
# for schedulers and printers most of the time.
test_preset() {
    local preset=$1
    shift
    cd "$source_dir" || die "cannot enter $source_dir"
    PATH=$PATH:/usr/sbin:/sbin ctest --preset "$preset" --output-on-failure -j "$((4 * $(nproc)))" "$@"
}
