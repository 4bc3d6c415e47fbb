#!/usr/bin/env bash
# The importer, run again, writes the sources of data/ that are checked in. Skipped where ICU is of another version.
set -euo pipefail
import=$2/bin/lexicor-import
[ -x "$import" ] || exit 77
work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT
"$import" "$work" >/dev/null
version() { sed -n '1s/.*(\(ICU [0-9.]*\)).*/\1/p' "$1/languages/English.toml"; }
[ "$(version "$work")" = "$(version "$1/data")" ] || exit 77
diff -r -q -x samples "$work" "$1/data"
