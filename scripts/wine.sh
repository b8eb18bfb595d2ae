# shellcheck shell=bash
# A Wine of its own for one run, with a screen of its own. Sourced after lib.sh, never run.

export WINEDEBUG=-all
# Left out: the .NET and the HTML engine, which Wine would offer to install, entries in somebody's menu, and the debugger that
# stops at a crash.
export WINEDLLOVERRIDES='mscoree=;mshtml=;winemenubuilder.exe=;winedbg.exe='

wine_folder=''
screen=''

# start_wine: sets WINEPREFIX and DISPLAY; both end with the script. A script that runs inside another uses the other's.
start_wine() {
    [[ -z ${FXPROBE_WINE-} ]] || return 0
    export FXPROBE_WINE=1
    local number
    wine_folder=$(mktemp -d)
    trap stop_wine EXIT
    trap 'exit 130' INT TERM
    export WINEPREFIX=$wine_folder/prefix
    mkfifo "$wine_folder/display"
    exec 7<>"$wine_folder/display"
    Xvfb -displayfd 7 -screen 0 1280x800x24 -nolisten tcp >/dev/null 2>&1 &
    screen=$!
    read -r -t 30 -u 7 number || fail "Xvfb did not start"
    exec 7>&-
    export DISPLAY=:$number
    step "Starting Wine" prepare_wine
}

# Wine's own processes live from its first program to its last and keep the output of whoever started them: a pipe to a test
# would never end. So they are started here, and a program with a window stays to keep them.
prepare_wine() {
    wine wineboot --init >/dev/null 2>&1 && wineserver --wait || return
    wine notepad >/dev/null 2>&1 &
    wine rundll32 user32.dll,MessageBeep >/dev/null 2>&1
}

# What was ended while Wine was starting it may have stayed.
# shellcheck disable=SC2317 # called by the trap
end_leftovers() {
    local process
    for process in /proc/[0-9]*; do
        if grep -qsxF wine64 "$process/comm" && grep -qsxzF "WINEPREFIX=$WINEPREFIX" "$process/environ"; then
            kill -KILL "${process#/proc/}" 2>/dev/null || true
        fi
    done
}

# shellcheck disable=SC2317 # called by the trap
stop_wine() {
    [[ -n $wine_folder ]] || return 0
    wineserver --kill || true
    end_leftovers
    if [[ -n $screen ]]; then kill "$screen" 2>/dev/null || true; fi
    wait
    rm -rf "$wine_folder"
}
