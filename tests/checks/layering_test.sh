#!/usr/bin/env bash
# Shows the layering check one include at a time and compares its verdict.
set -euo pipefail
check=$(dirname -- "$(readlink -f -- "$0")")/layering.sh
tree=$(mktemp -d)
trap 'rm -rf -- "$tree"' EXIT
failures=0 rows=0

# verdict FILE INCLUDE: what the check says of a tree with this one include.
verdict() {
    local file=$tree/$1
    mkdir -p -- "${file%/*}"
    printf '#include %s\n' "$2" >"$file"
    if "$check" "$tree" >/dev/null; then echo allowed; else echo refused; fi
    rm -- "$file"
}

while read -r expected file include; do
    [[ -n $expected ]] || continue
    ((rows += 1))
    actual=$(verdict "$file" "$include")
    if [[ $actual != "$expected" ]]; then
        echo "$file: #include $include: $actual, expected $expected"
        ((failures += 1))
    fi
done <<'TABLE'
allowed platform/foundation/network/IRI.cpp <unicode/uchar.h>
allowed platform/foundation/network/IRI.cpp <fl/i18n/case.hpp>
refused platform/foundation/network/IRI.cpp <storage/provider/StorageIRI.hpp>
refused platform/fl/filesystem/upath.hpp <storage/provider.hpp>
refused platform/fl/filesystem/upath.hpp "../../../storage/provider/PathView.hpp"

allowed storage/provider.hpp <storage/provider/StorageIRI.hpp>
allowed storage/provider/StorageIRI.hpp <storage/provider/detail/Lazy.hpp>
allowed storage/provider/StorageIRI.hpp <foundation/network/IRI.hpp>
allowed storage/provider/StorageIRI.hpp <boost/any.hpp>
allowed storage/provider/StorageIRI.hpp <string_view>
allowed storage/provider/detail/Lazy.cpp "Lazy.hpp"
refused storage/provider/StorageIRI.cpp <unistd.h>
refused storage/provider/StorageIRI.cpp <unicode/uchar.h>
refused storage/provider/StorageIRI.cpp <storage/local/LocalProvider.hpp>
refused storage/provider/StorageIRI.cpp "../local/LocalProvider.hpp"
refused storage/provider/StorageIRI.cpp <storage/registry/Registry.hpp>
refused storage/provider.hpp <storage/local.hpp>

allowed storage/local/LocalProvider.cpp <sys/stat.h>
allowed storage/local/LocalProvider.cpp <storage/local/detail/Errno.hpp>
allowed storage/local/LocalProvider.cpp <storage/provider.hpp>
allowed storage/local/detail/Listing.cpp "../LocalProvider.hpp"
refused storage/local/LocalProvider.cpp <storage/memory/MemoryProvider.hpp>
refused storage/local/LocalProvider.cpp <storage/registry/Registry.hpp>
refused storage/local/LocalProvider.cpp <storage/conformance/Harness.hpp>
refused storage/local/LocalProvider.cpp <storage/provider/detail/SafeByteStream.hpp>
refused storage/local/LocalProvider.cpp   "../provider/detail/SafeByteStream.hpp"
refused storage/local/LocalProvider.cpp <foundation/network/detail/Text.hpp>
refused storage/local/LocalProvider.cpp <tools/storage/Output.hpp>
refused storage/local/LocalProvider.cpp <tests/support/TemporaryFolder.hpp>
refused storage/conformance/Streams.cpp <storage/memory/MemoryProvider.hpp>

allowed storage/registry/registerAll.cpp <storage/local/LocalProviderFactory.hpp>
refused storage/registry/registerAll.cpp <storage/local/detail/Errno.hpp>
refused storage/registry/registerAll.cpp <tools/storage/Output.hpp>

allowed tools/storage/ls.cpp <storage/local/LocalProvider.hpp>
allowed tools/storage/ls.cpp <CLI/CLI.hpp>
allowed tools/storage/ls.cpp <tools/storage/Output.hpp>
refused tools/storage/ls.cpp <storage/local/detail/Errno.hpp>
refused tools/storage/ls.cpp <tests/support/TemporaryFolder.hpp>
refused examples/list.cpp <tools/storage/Output.hpp>
allowed bench/opening.cpp <storage/local/detail/Root.hpp>
refused bench/Addresses.cpp <tests/support/Allocations.hpp>

allowed tests/storage/local/ErrnoTest.cpp <storage/local/detail/Errno.hpp>
allowed tests/tools/storage/LsTest.cpp <tools/storage/Output.hpp>
TABLE

if "$check" "$tree" >/dev/null; then
    echo "a tree without a single include is allowed"
    ((failures += 1))
fi
echo "$rows includes tried, $failures wrong verdicts"
((rows > 0 && failures == 0))
