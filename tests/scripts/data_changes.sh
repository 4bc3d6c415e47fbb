#!/usr/bin/env bash
# Every change of shipped data since 1.0 stands in docs/data-changes.md, and the check sees one that does not.
set -euo pipefail
source_dir=$1 locale=$2/locale
"$source_dir/scripts/data-digests" --locale "$locale" --check
work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT
sed '0,/"digest":"./s/"digest":"./"digest":"x/; /"id":2,/d' "$locale/manifest.json" >"$work/manifest.json"
said=$("$source_dir/scripts/data-digests" --locale "$work" --check 2>&1) && exit 1
grep -qE '^la_00001 English x[0-9a-f]{15}$' <<<"$said"
grep -qE '^la_00002 \w+ removed$' <<<"$said"
