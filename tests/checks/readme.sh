#!/usr/bin/env bash
# readme.sh DOCUMENT: checks that each C++ block of a document is, letter for letter, the file that the line above names:
#
#   <!-- examples/some_example.cpp -->
#   ```cpp
#
# The path is taken from the folder of the document.
set -euo pipefail
document=$(readlink -f -- "$1")
cd -- "${document%/*}"

# block NUMBER: the n-th C++ block.
block() {
    awk -v wanted="$1" '/^```cpp$/ { ++n; inside = n == wanted; next } /^```$/ { inside = 0 } inside' "$document"
}

# Prints for each C++ block the path that the line above it names, an empty line where it names none.
named_files() {
    awk '/^```cpp$/ { print above } { above = /^<!-- .* -->$/ ? $2 : "" }' "$document"
}

count=0 failures=0
while read -r file; do
    ((count += 1))
    if [[ -z $file ]]; then
        echo "C++ block $count names no file"
        ((failures += 1))
    elif ! diff --label "$document" --label "$file" -u <(block "$count") "$file"; then
        ((failures += 1))
    fi
done < <(named_files)

echo "$count C++ blocks, $failures of them differ from their files"
((count > 0 && failures == 0))
