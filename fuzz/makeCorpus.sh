#!/usr/bin/env bash
# Makes small archives of every kind that is read, to begin fuzzing with: makeCorpus.sh FOLDER
# They go to FOLDER/FORMAT/, with names of the formats as ArchiveFormat has them.
# shellcheck disable=SC2016 # what stands in single quotes is for the shell that runs it
set -euo pipefail

mkdir -p -- "$1"
folder=$(cd -- "$1" && pwd)
tree=$(mktemp -d)
trap 'rm -rf -- "$tree"' EXIT
export LC_ALL=C.UTF-8

cd -- "$tree"
mkdir -p docs/empty
printf 'some text\n' >docs/text
printf 'content of a name in UTF-8' >'docs/é中'
head -c 3000 /dev/zero >zeros
truncate -s 20K holes
printf 'end' >>holes
ln -s docs/text link
ln -s /etc/passwd outside
ln docs/text hard
long=$(printf 'n%.0s' {1..150})
printf 'of a long name' >"$long"

# into FORMAT NAME COMMAND...: runs a command that makes the file "archive" beside the tree.
into() {
    local format=$1 name=$2
    shift 2
    mkdir -p -- "$folder/$format"
    rm -f -- "$folder/$format/$name"
    archive=$folder/$format/$name "$@"
}

in_shell() { bash -c "set -euo pipefail; $1"; }

for format in v7 ustar gnu posix; do
    into Tar "$format" in_shell "tar --sort=name --format=$format -cf \"\$archive\" docs zeros link hard"
done
into Tar sparse-gnu in_shell 'tar --format=gnu -b1 -Scf "$archive" holes docs/text'
for version in 0.0 0.1 1.0; do
    into Tar "sparse-$version" in_shell "tar --format=posix -b1 --sparse-version=$version -Scf \"\$archive\" holes docs/text"
done
into Tar long in_shell "tar --format=gnu -b1 -cf \"\$archive\" $long outside"
into Tar pax in_shell "bsdtar --format pax -b1 -cf \"\$archive\" $long 'docs/é中' hard docs/text"
for compression in gzip bzip2 xz lzma zstd; do
    into Tar "$compression" in_shell "tar -b1 -cf - docs link | $compression -c >\"\$archive\""
done

for format in newc odc crc bin; do
    into Cpio "$format" in_shell "find docs link hard | cpio --quiet -o -H $format >\"\$archive\""
done
into Cpio gzip in_shell 'find docs | cpio --quiet -o -H newc | gzip >"$archive"'

for method in LZMA LZMA2 PPMd BZip2 Deflate Copy; do
    into SevenZip "$method" in_shell "7z a -t7z -snl -m0=$method \"\$archive\" docs link zeros >/dev/null"
done
into SevenZip encrypted in_shell '7z a -t7z -psecret "$archive" docs >/dev/null'
into SevenZip headers-encrypted in_shell '7z a -t7z -psecret -mhe=on "$archive" docs >/dev/null'
into SevenZip bsdtar in_shell 'bsdtar --format 7zip -cf "$archive" docs zeros'

into Iso rock-ridge in_shell 'genisoimage -quiet -no-pad -R -o "$archive" docs'
into Iso joliet in_shell 'genisoimage -quiet -no-pad -J -input-charset utf-8 -o "$archive" docs'
into Iso plain in_shell 'genisoimage -quiet -no-pad -input-charset utf-8 -o "$archive" docs 2>/dev/null'

into Zip deflated in_shell 'zip -qry - docs link zeros | cat >"$archive"'
into Zip stored in_shell 'zip -0qr - docs | cat >"$archive"'
into Zip bsdtar in_shell 'bsdtar --format zip -cf "$archive" docs link'
