# shellcheck shell=bash
# What is built once from Debian's sources and then shared by all clones. Sourced after lib.sh, never run.

# shellcheck disable=SC2154 # $root comes from lib.sh

cache=${XDG_CACHE_HOME:-$HOME/.cache}/fxprobe

# upstream_version PACKAGE…: "source version" for each, as installed.
upstream_version() {
    # shellcheck disable=SC2016 # these are dpkg's variables
    dpkg-query --show --showformat='${source:Package} ${source:Upstream-Version}\n' "$@"
}

# cached_path NAME KEY-FUNCTION: the folder for what the function now says.
cached_path() {
    printf '%s/%s-%s\n' "$cache" "$1" "$("$2" | sha256sum | cut -c1-16)"
}

# build_cached NAME KEY-FUNCTION [TEXT FUNCTION]…: unless the folder is there, runs each function as a step, in a temporary
# folder in which they fill the folder "prefix"; that takes its place when the last one is done. $prefix is the place.
build_cached() {
    prefix=$(cached_path "$1" "$2")
    [[ ! -d $prefix ]] || return 0
    mkdir -p "$cache"
    exec 8>"$cache/$1.lock"
    if ! flock --nonblock 8; then
        printf 'Waiting for another build in %s\n' "$cache"
        flock 8
    fi
    [[ ! -d $prefix ]] || return 0

    # An interrupted build, its processes gone with the lock.
    rm -rf "$cache/$1"-*.part
    mkdir "$prefix.part"
    shift 2
    while (($# > 0)); do
        step "$1" in_folder "$prefix.part" "$2"
        shift 2
    done
    mv "$prefix.part/prefix" "$prefix"
    rm -rf "$prefix.part"
    exec 8>&-
}

# in_folder FOLDER FUNCTION: in a process of its own, since a failing command inside a step would not end the function.
in_folder() { (cd "$1" && prefix=$prefix exec "$root/scripts/${0##*/}" --build "$2"); }

# debian_source PACKAGE: fetches the upstream archive of a source package, in the version that is installed here, into
# the current folder and tells its name.
debian_source() {
    local archive
    source_lists
    apt_private --quiet source --download-only --tar-only "$1" >&2
    for archive in "$1"_*.orig.tar.*; do
        if [[ $archive == "$1_$(upstream_version_of "$1").orig.tar."* && $archive != *.asc ]]; then
            printf '%s\n' "$archive"
            return
        fi
    done
    printf 'The mirror has another version of %s than this machine: apt-get upgrade\n' "$1" >&2
    return 1
}

# unpack PACKAGE FOLDER: the upstream archive of a source package.
unpack() {
    mkdir -p "$2"
    tar -xf "$(debian_source "$1")" -C "$2" --strip-components=1
}

upstream_version_of() {
    # shellcheck disable=SC2016 # these are dpkg's variables
    dpkg-query --show --showformat='${source:Package} ${source:Upstream-Version}\n' | awk -v name="$1" '
        $1 == name { print $2; exit }'
}

# apt_private ARGUMENT…: apt-get with lists of its own, for source packages only. It needs no root and leaves the
# machine's own lists, which hardly ever have any, as they are.
apt_private() {
    apt-get -o Dir::Etc::SourceList=/dev/null -o Dir::Etc::SourceParts="$PWD/sources.list.d" \
        -o Dir::State::Lists="$PWD/lists" -o Dir::Cache="$PWD/apt-cache" -o APT::Sandbox::User= "$@"
}

# source_lists: for the mirrors from which this machine takes Debian itself.
source_lists() {
    [[ ! -d sources.list.d ]] || return 0
    mkdir -p sources.list.d lists/partial apt-cache/archives/partial
    local suites file
    # shellcheck source=/dev/null
    suites="$(. /etc/os-release && printf '%s' "$VERSION_CODENAME")|(old)*stable"
    for file in /etc/apt/sources.list /etc/apt/sources.list.d/*; do
        [[ -f $file ]] || continue
        case $file in
            *.list) awk -v suites="$suites" '
                /^[ \t]*deb[ \t]/ && !/cdrom:/ && $0 ~ "[ \t](" suites ")(-updates|-security|/updates)?[ \t]" && /[ \t]main/ {
                    sub(/deb/, "deb-src")
                    print
                }' "$file" >"sources.list.d/${file##*/}" ;;
            *.sources) awk -v RS= -v suites="$suites" '
                /(^|\n)Types:[^\n]*deb/ && !/(^|\n)Enabled: *no/ && /(^|\n)Components:[^\n]* main/ &&
                $0 ~ "\nSuites:[^\n]*[ \t](" suites ")(-updates|-security)?[ \t\n]" {
                    sub(/Types:[^\n]*/, "Types: deb-src")
                    print $0 "\n"
                }' "$file" >"sources.list.d/${file##*/}" ;;
        esac
    done
    apt_private --quiet update >&2
}
