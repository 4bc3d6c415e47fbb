#!/usr/bin/env bash
# What the pages show does as they say: the programs of examples/c, README.md and docs/cpp.md are compiled and run, and
# commands are run. texts.sh runs those of the README, cli_rules those of docs/own-order.md, and the test python those of
# docs/python.md.
set -euo pipefail
source_dir=$1 build_dir=$2
if grep -qE '__(asan|tsan|ubsan)_' < <(nm -D --undefined-only "$build_dir/lib/liblexicor.so"); then exit 77; fi
work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT
flags=$(grep '^CMAKE_CXX_FLAGS:' "$build_dir/CMakeCache.txt" | cut -d= -f2-)
export LX_LOCALEDIR=$build_dir/locale NLS1_LOCALEDIR=$build_dir/locale

block() { sed -n "/^\`\`\`$2\$/,/^\`\`\`\$/{/^\`\`\`/d;p}" "$source_dir/$1.md"; }
# compiled COMPILER... SOURCE: a program against the library.
compiled() {
  # shellcheck disable=SC2086
  "${@:1:$#-1}" $flags -Wall -Wextra -Werror -I"$source_dir/include" "${@: -1}" -L"$build_dir/lib" -llexicor \
    -Wl,-rpath,"$build_dir/lib" -o "$work/program"
}

# A program for each family of functions, which ends with what it prints.
printf '$set 1\n1 Disk full\n' | "$build_dir/bin/lexicor-gencat" "$work/app.cat"
for example in "$source_dir"/examples/c/*.c; do
  compiled gcc -std=c99 -ftrivial-auto-var-init=pattern "$example"
  (cd "$work" && ./program) | diff -u --label "$example" <(sed '1,/^\/\* Prints:$/d; /^\*\/$/d' "$example") -
done

block docs/cpp cpp >"$work/page.cpp"
compiled g++ -std=c++17 "$work/page.cpp"
"$work/program" "$build_dir/locale" | diff -au <(block docs/cpp text) -

# The program of the README by the command below it.
block README c | sed "s|build/m64|$build_dir|" >"$work/hello.c"
hello=$(sed -n "s|build/m64|$build_dir|g; s|hello\.c|$work/&|; s|/tmp/hello|$work/hello|g; /^cc /{s/^cc/gcc $flags/;p}" "$source_dir/README.md")
[ "$(cd "$source_dir" && PWD= && eval "$hello")" = GROß ]

# The picture and the table of the README, once.
[ -n "$flags" ] || {
  "$build_dir/bin/lexicor" chart IBM930 --html | "$source_dir/scripts/chart-picture" | cmp - "$source_dir/docs/chart.svg"
  bash "$source_dir/tools/lexicor/demo.sh" "$build_dir" | sed -n '/^Locale /,/^$/{/./p}' | diff -u <(block README text) -
}

# The digest of an object by other means.
[ "$(cd "$build_dir/locale" && eval "$(block docs/locale-directory sh)" | sed 's/-$//' | tr -d ' \n' | fold -w 64 | uniq | wc -l)" = 1 ]

# The first commands of docs/python.md, in this directory; Debian's Python has the word size of the system.
[ -n "$flags" ] || [ "$(cd "$source_dir" && export PYTHONDONTWRITEBYTECODE=1 &&
  eval "$(grep -A1 '^    export LEXICOR_LIBRARY' docs/python.md | sed "s|\$PWD/build/m64|$build_dir|")")" = 1.234,50 ]

transcript() { "$source_dir/tests/scripts/transcript.py" "$source_dir" "$build_dir" "$source_dir/docs/$1.md"; }
transcript conversion-losses
[ -n "$flags" ] || [ ! -e "$build_dir/lib/lexicor.so" ] || EXTENSION=$build_dir/lib/lexicor.so transcript sqlite
