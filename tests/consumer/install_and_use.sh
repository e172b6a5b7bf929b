#!/usr/bin/env bash
# install_and_use.sh BUILD COMPILER [FLAGS]: installs the given build, moves what was installed to another place, and there
# builds and runs a user's project with find_package, and runs the installed command line tool.
set -euo pipefail
build=$1 compiler=$2 flags=${3:-}
source=$(dirname -- "$(readlink -f -- "$0")")
work=$(mktemp -d)
trap 'rm -rf -- "$work"' EXIT

run() {
    local status=0
    "$@" >"$work/log" 2>&1 || status=$?
    if ((status != 0)); then
        cat -- "$work/log"
        echo "failed (status $status): $*"
        exit 1
    fi
}

run cmake --install "$build" --prefix "$work/installed"
mv -- "$work/installed" "$work/moved"
run cmake -S "$source" -B "$work/build" -G Ninja -D CMAKE_BUILD_TYPE=Debug -D CMAKE_PREFIX_PATH="$work/moved" \
    -D CMAKE_CXX_COMPILER="$compiler" -D CMAKE_CXX_FLAGS="$flags"
run cmake --build "$work/build"

mkdir -- "$work/folder"
"$work/build/consumer" "file://$work/folder"
# A build that makes the kit must install it so that it can be used.
if grep --quiet '^FOUNDATION_BUILD_CONFORMANCE:BOOL=ON' -- "$build/CMakeCache.txt"; then
    run "$work/build/conformance"
fi
touch -- "$work/folder/a file"
listed=$("$work/moved/bin/storage" ls "$work/folder")
[[ $listed == "a file" ]] || { echo "the installed tool lists: $listed"; exit 1; }
share=$work/moved/share
for file in man/man1/storage.1 bash-completion/completions/storage fish/vendor_completions.d/storage.fish \
    zsh/site-functions/_storage; do
    grep --quiet mkdir -- "$share/$file" || { echo "not installed, or without a command of the tool: share/$file"; exit 1; }
done
