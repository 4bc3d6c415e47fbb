#!/usr/bin/env bash
# packages.sh [DIR]   The packages of ./package (those in DIR, or made anew in build/package) are those of another build, in
#                     another place, at another time and under another locale, byte for byte; in a fresh system each
#                     installs, does what it is for, and goes without a trace. Needs root.
set -euo pipefail
cd "$(dirname "$0")/../.."
first=$(realpath -m "${1:-build/package}")
scripts/install debootstrap
work=$(mktemp -d /var/tmp/lexicor-packages-XXXXXX)
root=$work/root
trap 'umount -q "$root/proc" || true; rm -rf --one-file-system "$work"' EXIT
fail() { echo "packages: $*" >&2; exit 1; }

[ $# -eq 1 ] || ./package >/dev/null
mkdir "$work/tree"
git ls-files -z --cached --others --exclude-standard | tar -c --null --files-from=- | tar -x -C "$work/tree"
(cd "$work/tree" && git init -q && umask 027 && TZ=Asia/Tokyo LC_ALL=C.UTF-8 ./package "$work/second" >/dev/null)
for package in "$first"/*.deb; do
  cmp "$package" "$work/second/${package##*/}" || fail "another build gives another ${package##*/}"
done

mirror=$({ sed -n 's/^deb [^h]*\(http[^ ]*\) .*/\1/p; s/^URIs: *\([^ ]*\).*/\1/p' /etc/apt/sources.list /etc/apt/sources.list.d/* 2>/dev/null || true; } |
  grep -m 1 '/debian/*$')
debootstrap --variant=minbase bookworm "$root" "$mirror" >"$work/debootstrap.log" || { tail "$work/debootstrap.log"; fail debootstrap; }
mount -t proc proc "$root/proc"
mkdir "$root/packages"
find "$first" -name '*.deb' ! -name '*-dbgsym_*' -exec cp {} "$root/packages" \;
cp tests/packages/use.sh "$root/packages"
cp data/samples/catalog/german.msg "$root/packages"
DEBIAN_FRONTEND=noninteractive chroot "$root" bash /packages/use.sh
echo "$(ls "$root"/packages/*.deb | wc -l) packages: the same bytes twice, installed, used and removed"
