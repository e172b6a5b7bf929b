#!/usr/bin/env bash
# layering.sh [ROOT]: checks that every #include of the tree points down, from the tools and the registry through the
# providers and the core to the platform libraries, and that no library reaches into the detail/ of another.
set -euo pipefail
cd -- "${1:-$(dirname -- "$0")/../..}"

folders=()
for folder in platform storage tools examples tests bench fuzz; do
    [[ ! -d $folder ]] || folders+=("$folder")
done

# Lines of the form  FILE:LINE:#include <PATH  with the spaces as written.
includes() {
    grep -rnoE --include='*.hpp' --include='*.cpp' '^[[:space:]]*#[[:space:]]*include[[:space:]]*[<"][^>"]+' "${folders[@]}"
}

includes | awk '
# The library or folder that a path of the tree belongs to: platform, storage/local, tools ...
function area(path,    parts) {
    split(path, parts, "/")
    if (parts[1] == "foundation" || parts[1] == "fl")
        return "platform"
    if (parts[1] != "storage")
        return parts[1]
    sub(/\.hpp$/, "", parts[2])
    return "storage/" parts[2]
}

# The same for what stands between < and >; what is not ours is "std", "boost" or "other".
function included_area(path) {
    if (path ~ /^(foundation|fl|platform|storage|tools|examples|tests|bench|fuzz)\//)
        return area(path)
    if (path ~ /^boost\//)
        return "boost"
    return path ~ /[\/.]/ ? "other" : "std"
}

# Resolves what stands between quotes against the folder of the file.
function resolved(file, path) {
    sub(/[^\/]*$/, "", file)
    path = file path
    while (sub(/(^|\/)\.\//, "/", path) || sub(/[^\/]+\/\.\.\//, "", path)) {}
    sub(/^\//, "", path)
    return path
}

# Says why code of one area must not include code of another; says nothing when it may.
function objection(from, to) {
    if (from == to || to == "std" || to == "boost" || from == "tests")
        return ""
    if (from == "storage/provider" && to != "platform")
        return "the core stands on the standard library, Boost and platform/ alone"
    if (to == "other" || to == "platform")
        return ""
    if (from == "platform")
        return "platform/ knows nothing of what stands on it"
    if (to !~ /^storage\//)
        return "nothing but its own files includes from " to "/"
    if (to == "storage/provider" || from == "storage/registry" || from !~ /^storage\//)
        return ""
    return "a provider knows no other library of storage/ than the core"
}

{
    match($0, /:[0-9]+:/)
    file = substr($0, 1, RSTART - 1)
    line = substr($0, RSTART + 1, RLENGTH - 2)
    path = substr($0, RSTART + RLENGTH)
    quoted = path ~ /^[^<]*"/
    sub(/^[^<"]*[<"]/, "", path)
    from = area(file)
    to = quoted ? area(resolved(file, path)) : included_area(path)

    why = objection(from, to)
    if (why == "" && from != to && from != "tests" && from != "bench" && to != "other" && to != "boost" && ("/" path) ~ /\/detail\//)
        why = "detail/ is for " to " itself"
    if (why != "") {
        print file ":" line ": " path ": " why
        ++refused
    }
}

END {
    print NR " includes, " refused + 0 " of them refused"
    exit NR == 0 || refused > 0
}'
