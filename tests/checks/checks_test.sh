#!/usr/bin/env bash
# Shows the checks of this folder a tree that is in order and trees that are not.
set -euo pipefail
here=$(dirname -- "$(readlink -f -- "$0")")
tree=$(mktemp -d)
trap 'rm -rf -- "$tree"' EXIT
failures=0

# expect accepted|refused WHAT COMMAND...
expect() {
    local expected=$1 what=$2 actual=accepted
    shift 2
    "$@" >/dev/null 2>&1 || actual=refused
    if [[ $actual != "$expected" ]]; then
        echo "$what: $actual, expected $expected"
        failures=$((failures + 1))
    fi
}

mkdir -p -- "$tree"/{platform,storage,tools,examples,tests/storage}
touch -- "$tree/storage/a.cpp" "$tree/tests/storage/aTest.cpp"
for source in storage/a.cpp tests/storage/aTest.cpp; do
    printf '{\n  "command": "c++",\n  "file": "%s/%s"\n},\n' "$tree" "$source"
done >"$tree/compile_commands.json"
expect accepted "all sources built" "$here/built.sh" "$tree" "$tree/compile_commands.json"
touch -- "$tree/tests/storage/bTest.cpp"
expect refused "a test that is not built" "$here/built.sh" "$tree" "$tree/compile_commands.json"
find "$tree" -name '*.cpp' -delete
expect refused "no sources at all" "$here/built.sh" "$tree" "$tree/compile_commands.json"

# document LINE...: writes a README of these lines.
document() {
    printf '%s\n' "$@" >"$tree/README.md"
}
printf 'int main()\n{\n}\n' >"$tree/examples/a.cpp"
document 'Text' '<!-- examples/a.cpp -->' '```cpp' 'int main()' '{' '}' '```' 'Text'
expect accepted "a quoted example" "$here/readme.sh" "$tree/README.md"
document '<!-- examples/a.cpp -->' '```cpp' 'int main()' '{' '    return 1;' '}' '```'
expect refused "an example that differs" "$here/readme.sh" "$tree/README.md"
document '<!-- examples/b.cpp -->' '```cpp' 'int main()' '{' '}' '```'
expect refused "an example without its file" "$here/readme.sh" "$tree/README.md"
document '<!-- examples/a.cpp -->' '```cpp' 'int main()' '{' '}' '```' '```cpp' 'int i;' '```'
expect refused "a block that names no file" "$here/readme.sh" "$tree/README.md"
document 'Text'
expect refused "a document without an example" "$here/readme.sh" "$tree/README.md"

echo "$failures wrong verdicts"
((failures == 0))
