# shellcheck shell=bash
# Sourced by bin/storage, bin/test and .ci/run: installs missing packages, configures and builds presets.
#
# Standard input and standard output belong to the caller's job: nothing here reads the one or writes to the other.
# What a step prints goes to a log in build/ and is shown when the step fails.

root=$(dirname -- "$(dirname -- "$(readlink -f -- "${BASH_SOURCE[0]}")")")
program=${0##*/}

note() {
    printf '%s: %s\n' "$program" "$*" >&2
}

# run_logged LOG COMMAND...
run_logged() {
    local log=$1 status=0
    shift
    "$@" </dev/null >"$log" 2>&1 || status=$?
    if ((status != 0)); then
        cat -- "$log" >&2
        note "failed (status $status): $* (log: $log)"
    fi
    return "$status"
}

# with_lock NAME COMMAND...: lets one process at a time run COMMAND, in a subshell that holds the lock.
with_lock() {
    local name=$1
    shift
    mkdir -p -- "$root/build" || return
    (
        if ! flock --nonblock 9; then
            note "waiting for another process that builds here ..."
            flock 9
        fi
        "$@" 9>&-
    ) 9>"$root/build/.$name.lock"
}

# Prints the lines of the package list of the given groups, without the group, of which no package is installed.
missing_packages() {
    local -A wanted=() installed=()
    local group packages package fields lines=() names=()
    for group in "$@"; do
        wanted[$group]=1
    done
    while read -ra fields; do
        [[ -n ${wanted[${fields[0]}]:-} ]] || continue
        lines+=("${fields[*]:1}")
        names+=("${fields[@]:1}")
    done < <(grep -v '^ *\(#\|$\)' -- "$root/cmake/debian-packages.txt")

    while read -r package; do
        installed[$package]=1
    done < <(dpkg-query --show --showformat '${db:Status-Status} ${Package}\n' "${names[@]}" 2>/dev/null |
        sed -n 's/^installed //p')

    for packages in "${lines[@]}"; do
        for package in $packages; do
            [[ -z ${installed[$package]:-} ]] || continue 2
        done
        printf '%s\n' "$packages"
    done
}

# Prints the first of the packages that apt could install; fails when it knows none of them.
first_available() {
    local package
    for package in "$@"; do
        if apt-cache show --no-all-versions "$package" >/dev/null 2>&1; then
            printf '%s\n' "$package"
            return
        fi
    done
    return 1
}

# Reads lines of alternatives, prints one package for each; fails when apt does not know one.
choose_packages() {
    local line packages status=0
    while read -r line; do
        read -ra packages <<<"$line"
        first_available "${packages[@]}" || status=1
    done
    return "$status"
}

apt_get() {
    local as_root=()
    ((EUID == 0)) || as_root=(sudo)
    "${as_root[@]}" env DEBIAN_FRONTEND=noninteractive apt-get --yes --option DPkg::Lock::Timeout=600 "$@"
}

# Nothing is ever removed to make room: where that would be needed, apt fails and its log names the packages.
apt_install() {
    apt_get install --no-install-recommends --no-remove "$@"
}

install_missing() {
    local log=$root/build/packages.log missing packages updated=0
    missing=$(missing_packages "$@")
    [[ -n $missing ]] || return 0

    if ! packages=$(choose_packages <<<"$missing"); then
        note "updating the package lists ..."
        run_logged "$log" apt_get update || true
        updated=1
        packages=$(choose_packages <<<"$missing") || note "no package is known for one of: ${missing//$'\n'/, }"
    fi
    [[ -n $packages ]] || return 1
    note "installing packages: ${packages//$'\n'/ }"
    mapfile -t packages <<<"$packages"
    if ((updated == 0)); then
        apt_install "${packages[@]}" </dev/null >"$log" 2>&1 && return
        note "trying again with fresh package lists ..."
        run_logged "$log" apt_get update || true
    fi
    run_logged "$log" apt_install "${packages[@]}"
}

# install_packages GROUP...: installs what is missing of the groups of the package list. Where that cannot be done, the
# caller goes on: what is needed may have come from elsewhere, and if not, the build says what it lacks.
install_packages() {
    local missing
    if ! command -v dpkg-query >/dev/null || ! command -v apt-get >/dev/null; then
        return 0
    fi
    missing=$(missing_packages "$@")
    [[ -n $missing ]] || return 0
    if ((EUID != 0)) && ! command -v sudo >/dev/null; then
        note "these packages are missing, and only root can install them: ${missing//$'\n'/, }"
        return 0
    fi
    with_lock packages install_missing "$@" || note "going on without the missing packages"
}

# configure PRESET [CMAKE ARGUMENT]...: runs CMake where it has not run yet, or not since the presets changed. Everything
# else that CMake reads is watched by the build itself.
configure() {
    local build=$root/build/$1 key="$root $*" preset=$1 fresh=()
    local stamp=$build/.configured
    if [[ -e $stamp && ! $root/CMakePresets.json -nt $stamp && $(<"$stamp") == "$key" ]]; then
        return 0
    fi
    shift
    # A build folder that came here from another place names its old sources.
    if [[ -e $build/CMakeCache.txt ]] &&
        ! grep --quiet --line-regexp --fixed-strings "CMAKE_HOME_DIRECTORY:INTERNAL=$root" "$build/CMakeCache.txt"; then
        fresh=(--fresh)
    fi
    mkdir -p -- "$build" && rm -f -- "$stamp" || return
    run_logged "$build/configure.log" cmake -S "$root" --preset "$preset" "${fresh[@]}" "$@" || return
    printf '%s\n' "$key" >"$stamp"
}

# build PRESET [TARGET]...
build() {
    local build=$root/build/$1 targets=()
    shift
    (($# == 0)) || targets=(--target "$@")
    run_logged "$build/build.log" cmake --build "$build" "${targets[@]}" -- --quiet
}
