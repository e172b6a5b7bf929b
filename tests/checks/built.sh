#!/usr/bin/env bash
# built.sh ROOT COMPILE_COMMANDS: checks that the build compiles every source file of the tree, so that no test is forgotten.
# The consumer project is built by a test of its own, the benchmarks by their own preset.
set -euo pipefail
root=$(readlink -f -- "$1")
commands=$2

sources() {
    (cd -- "$root" && find platform storage tools examples tests -name '*.cpp' ! -path 'tests/consumer/*' | sort)
}

compiled() {
    sed -n "s|^ *\"file\": \"$root/\(.*\)\",\{0,1\}\$|\1|p" -- "$commands" | sort -u
}

forgotten=$(comm -23 <(sources) <(compiled))
count=$(sources | wc -l)
if [[ -n $forgotten ]]; then
    printf 'not built: %s\n' "${forgotten//$'\n'/$'\n'not built: }"
    exit 1
fi
echo "$count source files, all of them built"
((count > 0))
