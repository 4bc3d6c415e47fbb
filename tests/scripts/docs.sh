#!/usr/bin/env bash
# The pages of other languages do as they say: the program of docs/cpp.md is compiled and run, and the commands of
# docs/sqlite.md are a transcript.
set -euo pipefail
source_dir=$1 build_dir=$2
if grep -qE '__(asan|tsan|ubsan)_' < <(nm -D --undefined-only "$build_dir/lib/liblexicor.so"); then exit 77; fi
work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT
flags=$(grep '^CMAKE_CXX_FLAGS:' "$build_dir/CMakeCache.txt" | cut -d= -f2-)

block() { sed -n "/^\`\`\`$2\$/,/^\`\`\`\$/{/^\`\`\`/d;p}" "$source_dir/docs/$1.md"; }
block cpp cpp >"$work/page.cpp"
# shellcheck disable=SC2086
g++ $flags -std=c++17 -Wall -Wextra -Werror -I"$source_dir/include" "$work/page.cpp" -L"$build_dir/lib" -llexicor \
  -Wl,-rpath,"$build_dir/lib" -o "$work/page"
"$work/page" "$build_dir/locale" | diff -au <(block cpp text) -

# The first commands of docs/python.md, in this directory; Debian's Python has the word size of the system.
[ -n "$flags" ] || [ "$(cd "$source_dir" && export PYTHONDONTWRITEBYTECODE=1 &&
  eval "$(grep -A1 '^    export LEXICOR_LIBRARY' docs/python.md | sed "s|\$PWD/build/m64|$build_dir|")")" = 1.234,50 ]
[ -n "$flags" ] || [ ! -e "$build_dir/lib/lexicor.so" ] || EXTENSION=$build_dir/lib/lexicor.so \
  "$source_dir/tests/scripts/transcript.py" "$source_dir" "$build_dir" "$source_dir/docs/sqlite.md"
