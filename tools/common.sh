# Shared by run, test, bench and the tools; sourced by bash, never run. Sets `top` and gives the functions below.
# shellcheck shell=bash

top=$(cd "$(dirname "${BASH_SOURCE[0]}")/.." && pwd)

# fail TEXT: ends the script with one line.
fail() {
    printf '%s: %s\n' "${0##*/}" "$1" >&2
    exit 1
}

# announce TEXT COMMAND…: runs the command, and says the text if it is still running after half a second.
announce() {
    local text=$1 timer status=0
    shift
    # The sleep gets no output of its own: one that outlives us must not keep a pipe open.
    { sleep 0.5 >/dev/null 2>&1 && printf '%s\n' "$text" >&2; } &
    timer=$!
    "$@" || status=$?
    kill "$timer" 2>/dev/null || true
    wait "$timer" 2>/dev/null || true
    return "$status"
}

# quietly COMMAND…: shows what the command says only if it fails.
quietly() {
    local log status=0
    log=$(mktemp)
    "$@" >"$log" 2>&1 || { status=$?; cat "$log" >&2; }
    rm -f "$log"
    return "$status"
}

# packagesIn SECTION…: the packages of these sections of packaging/packages.txt, each once.
packagesIn() {
    awk -v wanted=" $* " '
        { sub(/#.*/, "") }
        /^\[.*\]/ { section = substr($1, 2, length($1) - 2); next }
        NF && index(wanted, " " section " ") && !seen[$1]++ { print $1 }' "$top/packaging/packages.txt"
}

# installPackages SECTION…: installs what is missing. Ends the script with the one command to type where it may not.
installPackages() {
    local wanted name missing=() install
    local -A there=()
    if ! command -v dpkg-query >/dev/null; then
        echo "This is not a Debian system: the packages of packaging/packages.txt are not checked." >&2
        return
    fi
    mapfile -t wanted < <(packagesIn "$@")
    for name in $(dpkg-query -W -f '${db:Status-Status}:${Package}\n' "${wanted[@]}" 2>/dev/null); do
        [[ $name != installed:* ]] || there[${name#*:}]=yes
    done
    for name in "${wanted[@]}"; do
        [ -n "${there[$name]-}" ] || missing+=("$name")
    done
    [ "${#missing[@]}" -gt 0 ] || return 0

    install="apt-get update -qq && DEBIAN_FRONTEND=noninteractive apt-get install -y -qq --no-install-recommends ${missing[*]}"
    if [ "$(id -u)" = 0 ]; then
        install=(sh -c "$install")
    elif command -v sudo >/dev/null; then
        install=(sudo sh -c "$install")
    else
        printf 'Packages are missing. Install them with this one command, then start again:\n\n  su -c "%s"\n\n' "$install" >&2
        exit 1
    fi
    echo "Installing ${#missing[@]} packages: ${missing[*]}" >&2
    quietly "${install[@]}" || fail "the packages could not be installed"
}

# buildPreset PRESET [TARGET…]: configures where that is needed, builds the targets (all of them by default).
buildPreset() {
    local preset=$1 build="$top/build/$1"
    shift
    # Ninja itself configures again when a CMake file changes; the presets are the one file that it does not know.
    if [ ! "$build/build.ninja" -nt "$top/CMakePresets.json" ]; then
        announce "Configuring $preset…" quietly cmake -S "$top" --preset "$preset" || fail "configuring $preset failed"
        touch "$build/build.ninja"
    fi
    announce "Building $preset (the first time takes minutes)…" runNinja "$build" "$@" || fail "building $preset failed"
}

# runNinja DIRECTORY [TARGET…]: with its progress on a terminal, with nothing but trouble elsewhere.
runNinja() {
    if [ -t 1 ]; then
        ninja -C "$@"
    else
        ninja --quiet -C "$@" | { grep -v '^ninja: no work to do\.$' || true; }
    fi
}
