# shellcheck shell=bash
# Sourced by the scripts: makes sure that what they need is installed. Knows Debian's packages; elsewhere it only
# looks for the commands and leaves the libraries to CMake's own messages.

# need_packages package...: installs the missing ones, or says which they are and exits. Silent when none is missing.
need_packages() {
    local package missing=()
    if ! command -v dpkg-query >/dev/null; then
        need_commands "$@"
        return
    fi
    for package; do
        is_installed "$package" || missing+=("$package")
    done
    [[ ${#missing[@]} -eq 0 ]] || install_packages "${missing[@]}"
}

is_installed() {
    dpkg-query -W -f '${db:Status-Status}\n' "$1" 2>/dev/null | grep -qx installed
}

install_packages() {
    local as_root=() log
    if [[ $EUID -ne 0 ]]; then
        as_root=(sudo -n)
    fi
    if ! command -v apt-get >/dev/null || ! "${as_root[@]}" true 2>/dev/null; then
        printf 'Missing packages. Please install them with:\n    sudo apt-get install %s\n' "$*" >&2
        exit 1
    fi
    echo "Installing $*"
    log=$(mktemp)
    # The package lists are fetched only when the ones at hand do not do.
    if ! { apt_get install "$@" || { apt_get update && apt_get install "$@"; }; } >"$log" 2>&1; then
        cat "$log" >&2
        rm -f "$log"
        printf 'Could not install: %s\n' "$*" >&2
        exit 1
    fi
    rm -f "$log"
}

apt_get() { # uses the caller's as_root
    "${as_root[@]}" env DEBIAN_FRONTEND=noninteractive \
        apt-get -y --no-install-recommends -o DPkg::Lock::Timeout=300 "$@" </dev/null
}

need_commands() {
    local package command missing=()
    for package; do
        case $package in
        ninja-build) command=ninja ;;
        qemu-user) command=qemu-arm ;;
        g++-i686-linux-gnu) command=i686-linux-gnu-g++ ;;
        g++-arm-linux-gnueabihf) command=arm-linux-gnueabihf-g++ ;;
        lib* | googletest) continue ;;
        *) command=$package ;;
        esac
        command -v "$command" >/dev/null || missing+=("$command")
    done
    if [[ ${#missing[@]} -gt 0 ]]; then
        printf 'Missing commands: %s. Please install them with the package manager of this system;\n' "${missing[*]}" >&2
        printf 'the Debian packages are: %s\n' "$*" >&2
        exit 1
    fi
}
