# shellcheck shell=bash
# What the scripts share. Sourced, never run.

set -euo pipefail

# File names and plug-in names are UTF-8, also where no locale is set up; ${#text} then counts characters.
export LC_ALL=C.UTF-8

root=$(cd "$(dirname "${BASH_SOURCE[0]}")/.." && pwd)

# Clones share what was compiled.
export CCACHE_BASEDIR=$root CCACHE_NOHASHDIR=1

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

# configure PRESET: with tests.
configure() {
    if ! grep -qs '^FXPROBE_BUILD_TESTS:BOOL=ON$' "$root/build/$1/CMakeCache.txt" || [[ ! -f $root/build/$1/build.ninja ]]; then
        step "Configuring $1" cmake -S "$root" --preset "$1" -DFXPROBE_BUILD_TESTS=ON
    fi
}

# configure_without_tests PRESET: leaves a tree that is configured already, with or without tests, as it is.
configure_without_tests() {
    if [[ ! -f $root/build/$1/build.ninja ]]; then
        step "Configuring $1" cmake -S "$root" --preset "$1" -DFXPROBE_BUILD_TESTS=OFF
    fi
}
