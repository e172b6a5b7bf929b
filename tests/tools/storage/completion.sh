#!/usr/bin/env bash
# completion.sh TOOL: loads the completions of the tool into zsh and fish; has fish complete, which needs no terminal for it.
set -euo pipefail
tool=$(readlink -f -- "$1")
work=$(mktemp -d)
trap 'rm -rf -- "$work"' EXIT
failures=0
cd -- "$work"
ln -s -- "$tool" storage
touch -- file

# expect LINE EXPECTED: EXPECTED is what is offered for the end of LINE, one after the other.
expect() {
    local actual
    # shellcheck disable=SC2016 # the variable is one of fish
    actual=$(PATH=$work:$PATH HOME=$work fish -c 'source script.fish; complete -C $argv[1]' "$1" | cut -f 1 | paste -sd ' ')
    if [[ $actual != "$2" ]]; then
        printf '%s: expected "%s", offered "%s"\n' "$1" "$2" "$actual"
        failures=$((failures + 1))
    fi
}

./storage completion zsh >script.zsh
zsh --no-exec script.zsh
./storage completion fish >script.fish
fish --no-execute script.fish
expect "storage mk" "mkdir"
expect "storage ls --so" "--sort"
expect "storage ls --sort " "name size time"
expect "storage ls --sort=t" "--sort=time"
expect "storage cat fi" "file"
expect "storage completion z" "zsh"
expect "storage find --name f" ""
expect "storage man f" ""

echo "$failures failures"
((failures == 0))
