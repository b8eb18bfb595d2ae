# shellcheck shell=bash
# What the scripts share. Sourced, never run.

set -euo pipefail

# File names and plug-in names are UTF-8, also where no locale is set up; ${#text} then counts characters.
export LC_ALL=C.UTF-8

root=$(cd "$(dirname "${BASH_SOURCE[0]}")/.." && pwd)

fail() {
    printf '%s: %s\n' "${0##*/}" "$*" >&2
    exit 1
}

# step TEXT COMMAND…: one line for the step; what the command prints is shown only when it fails.
step() {
    local text=$1 started=$SECONDS output status=0
    shift
    printf '%s… ' "$text"
    output=$("$@" 2>&1 </dev/null) || status=$?
    if ((status != 0)); then
        printf 'failed\n%s\n' "$output"
        exit "$status"
    fi
    if ((SECONDS - started > 1)); then printf 'done (%d s)\n' $((SECONDS - started)); else printf 'done\n'; fi
}

# in_root COMMAND…: where CMake finds the presets.
in_root() { (cd "$root" && "$@"); }

# configure PRESET [OPTION…]
configure() { step "Configuring $1" in_root cmake --preset "$@"; }

# build PRESET [TARGET…]: the targets, or what the preset names.
build() {
    local preset=$1
    shift
    step "Building ${*:-$preset}" in_root cmake --build --preset "$preset" ${@:+--target "$@"}
}

# configure_windows: from nothing when the libraries lie elsewhere now; a build folder remembers where it found each of them.
configure_windows() {
    local preset=windows-release configured=$root/build/windows-release/configured-with fresh=()
    local options=("-DFXPROBE_WINDOWS_PREFIX=$("$root/scripts/windows-toolchain" --prefix)"
        "-DFXPROBE_WINDOWS_PLUGINS=$("$root/scripts/windows-plugins" --prefix)"
        "-DFXPROBE_CLAP_PLUGINS=$("$root/scripts/clap-plugins" windows --prefix)")
    [[ -f $configured && $(<"$configured") == "${options[*]}" ]] || fresh=(--fresh)
    configure "$preset" "${fresh[@]}" "${options[@]}"
    printf '%s\n' "${options[*]}" >"$configured"
}

# run_tests PRESET [CTEST-OPTION…]: shows the tests as they run, and at the end whether all of them passed.
run_tests() {
    local preset=$1 log=$root/build/$1/ctest.log
    shift
    printf 'Testing %s\n' "$preset"
    if in_root ctest --preset "$preset" -j"$(nproc)" "$@" 2>&1 | tee "$log"; then
        printf '%s: passed\n' "$preset"
        return
    fi
    printf '%s: FAILED (%s)\n' "$preset" "$log"
    return 1
}
