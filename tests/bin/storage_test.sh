#!/usr/bin/env bash
# Tries bin/storage in a tree of its own, where CMake is a script that "builds" another script as the tool.
set -euo pipefail
repository=$(readlink -f -- "$(dirname -- "$0")/../..")
work=$(mktemp -d)
trap 'rm -rf -- "$work"' EXIT
tree="$work/a tree"
failures=0

# expect WHAT EXPECTED ACTUAL
expect() {
    if [[ $2 != "$3" ]]; then
        printf '%s:\n  expected: %q\n  actual:   %q\n' "$1" "$2" "$3"
        failures=$((failures + 1))
    fi
}

builds() {
    wc -l <"$work/builds"
}

mkdir -p -- "$tree"/{bin,cmake,platform,storage,tools/storage} "$work/path"
cp -- "$repository/bin/storage" "$tree/bin/"
cp -- "$repository/cmake/build.sh" "$tree/cmake/"
touch -- "$tree"/{CMakeLists.txt,CMakePresets.json,tools/storage/main.cpp} "$tree/cmake/debian-packages.txt" "$work/builds"

cat >"$work/tool" <<'TOOL'
#!/usr/bin/env bash
printf '<%s>' "$PWD" "$@" "$(cat)"
exit 42
TOOL
cat >"$work/path/cmake" <<CMAKE
#!/usr/bin/env bash
cat
echo "output of \$1"
[[ ! -e "$work/broken" ]] || exit 3
[[ \$1 == --build ]] || exit 0
echo build >>"$work/builds"
mkdir -p -- "$tree/build/tool/tools/storage"
install -- "$work/tool" "$tree/build/tool/tools/storage/storage"
CMAKE
chmod +x -- "$work/path/cmake"
export PATH="$work/path:$PATH"
cd -- "$work"

# call [ARGUMENT]...: sets $output, $errors and $status; standard input holds "input".
call() {
    status=0
    output=$("$tree/bin/storage" "$@" 2>"$work/errors" <<<"input") || status=$?
    errors=$(<"$work/errors")
}

call 'b c' '' $'new\nline' '*'
expect "arguments, working folder and standard input" "<$work><b c><><"$'new\nline'"><*><input>" "$output"
expect "the tool's exit status" 42 "$status"
expect "a first call builds" 1 "$(builds)"
expect "and says so" "storage: building the tool, which takes a few minutes the first time ..." "$errors"

call
expect "a second call does not build" 1 "$(builds)"
expect "and is quiet" "" "$errors"

ln -s -- "$tree/bin/storage" "$work/link"
expect "a call through a link" "<$work><x><>" "$("$work/link" x </dev/null || true)"

# Dates everything an hour back, the last build half an hour.
age() {
    find "$tree" -exec touch -d '-1 hour' -- {} +
    touch -d '-30 minutes' -- "$tree/build/tool/.built"
}

age
call
expect "old sources are not built again" 1 "$(builds)"
touch -- "$tree/tools/storage/main.cpp"
call
expect "a changed source is built" 2 "$(builds)"
age
touch -- "$tree/tools/storage"
call
expect "a source that came or went is built" 3 "$(builds)"

age
touch -- "$tree/platform"
touch -- "$work/broken"
call
expect "a failed build does not run the tool" "" "$output"
expect "and fails" 3 "$status"
expect "and shows what the build printed" "output of --build" "${errors%%$'\n'*}"
rm -- "$work/broken"

age
rm -r -- "$tree/build"
: >"$work/builds"
"$tree/bin/storage" </dev/null >"$work/one" 2>&1 &
"$tree/bin/storage" </dev/null >"$work/two" 2>&1 || true
wait $! || true
expect "two first calls at once build once" 1 "$(builds)"
expect "and both run the tool" "<$work><> <$work><>" "$(tail -qn 1 "$work/one") $(tail -qn 1 "$work/two")"

echo "$failures failures"
((failures == 0))
