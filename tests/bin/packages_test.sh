#!/usr/bin/env bash
# Tries what is installed for which list of packages, with stand-ins for dpkg-query and apt.
set -euo pipefail
repository=$(readlink -f -- "$(dirname -- "$0")/../..")
tree=$(mktemp -d)
trap 'rm -rf -- "$tree"' EXIT
failures=0

mkdir -p -- "$tree/cmake" "$tree/path"
cp -- "$repository/cmake/build.sh" "$tree/cmake/"
cat >"$tree/cmake/debian-packages.txt" <<'LIST'
# A comment
tool  g++
tool  new-boost  old-boost

test  gtest
LIST

# The stand-ins: the machine has the packages named in INSTALLED, apt knows those in KNOWN, and more after an update.
cat >"$tree/path/dpkg-query" <<'END'
#!/usr/bin/env bash
for package in $INSTALLED; do echo "installed $package"; done
echo "not-installed g++-removed"
END
cat >"$tree/path/apt-cache" <<'END'
#!/usr/bin/env bash
known=$KNOWN
[[ ! -e $TREE/updated ]] || known+=" $KNOWN_AFTER_UPDATE"
[[ " $known " == *" ${*: -1} "* ]]
END
cat >"$tree/path/apt-get" <<'END'
#!/usr/bin/env bash
words=()
for word in "$@"; do
    [[ $word == -* || $word == DPkg::* ]] || words+=("$word")
done
echo "${words[*]}" >>"$TREE/done"
[[ ${words[0]} != update ]] || touch -- "$TREE/updated"
END
printf '#!/usr/bin/env bash\nexec "$@"\n' >"$tree/path/sudo"
chmod +x -- "$tree"/path/*
export PATH="$tree/path:$PATH" TREE=$tree

# expect EXPECTED INSTALLED KNOWN KNOWN_AFTER_UPDATE GROUP...: EXPECTED is what apt-get was asked for.
expect() {
    local expected=$1 actual
    export INSTALLED=$2 KNOWN=$3 KNOWN_AFTER_UPDATE=$4
    shift 4
    rm -f -- "$tree/updated"
    : >"$tree/done"
    # shellcheck source=cmake/build.sh
    (source "$tree/cmake/build.sh" && install_packages "$@") 2>"$tree/errors"
    actual=$(paste -sd ' ' "$tree/done")
    if [[ $actual != "$expected" ]]; then
        printf 'installed "%s", known "%s" and "%s", wanted "%s":\n' "$INSTALLED" "$KNOWN" "$KNOWN_AFTER_UPDATE" "$*"
        printf '  expected: %s\n  actual:   %s\n' "$expected" "$actual"
        failures=$((failures + 1))
    fi
}

expect "" "g++ new-boost" "" "" tool
expect "" "g++ old-boost" "g++ new-boost" "" tool
expect "install g++ new-boost" "" "g++ new-boost old-boost" "" tool
expect "install g++ old-boost" "" "g++ old-boost" "" tool
expect "install gtest" "g++ new-boost" "g++ new-boost gtest" "" tool test
expect "update install g++ new-boost" "" "" "g++ new-boost old-boost" tool
expect "update install g++" "" "g++" "" tool
expect "update" "" "" "" tool

echo "$failures failures"
((failures == 0))
