#!/usr/bin/env bash
# The checked-in Unicode tables are what the generator makes of the character database. Skipped where the installed
# database is of another version.
set -euo pipefail
cd "$1"
database=/usr/share/unicode
[ -f "$database/UnicodeData.txt" ] || exit 77
grep -q 'Unicode 15\.0\|15\.0\.0' "$database/DerivedAge.txt" || exit 77
python3 tools/unidata/generate.py --check
