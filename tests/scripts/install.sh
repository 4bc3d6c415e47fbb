#!/usr/bin/env bash
# An installed Lexicor serves a program that finds it by CMake package, and one that uses the flags of pkg-config.
set -euo pipefail
source_dir=$1 build_dir=$2
# A sanitizer build is not one to install.
if grep -qE '__(asan|tsan|ubsan)_' < <(nm -D --undefined-only "$build_dir/lib/liblexicor.so"); then exit 77; fi

work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT
cmake --install "$build_dir" --prefix "$work/prefix" >/dev/null

mkdir "$work/program"
# The program of the README, which must say what it converts.
sed -n '/^```c$/,/^```$/{/^```/d;s|"build/m64/locale"|LOCALE_DIR|;p}' "$source_dir/README.md" >"$work/program/main.c"
cat >"$work/program/CMakeLists.txt" <<'PROGRAM'
cmake_minimum_required(VERSION 3.25)
project(program C)
find_package(Lexicor 1 REQUIRED)
add_executable(program main.c)
target_compile_definitions(program PRIVATE LOCALE_DIR="${LEXICOR_LOCALE_DIR}")
target_link_libraries(program PRIVATE Lexicor::lexicor)
PROGRAM
flags=$(grep '^CMAKE_C_FLAGS:' "$build_dir/CMakeCache.txt" | cut -d= -f2-)
cmake -S "$work/program" -B "$work/program/build" -G Ninja -DCMAKE_PREFIX_PATH="$work/prefix" \
  -DCMAKE_C_FLAGS="$flags" >/dev/null
cmake --build "$work/program/build" >/dev/null
[ "$("$work/program/build/program")" = GROß ]

# The .pc file by hand, so that no package is needed for the check.
package=$(find "$work/prefix" -name lexicor.pc)
value() { sed -n "s/^$1[:=] *//p" "$package" | sed "s|\${libdir}|$libdir|; s|\${includedir}|$work/prefix/include|"; }
libdir=$(dirname "$(dirname "$package")")
# shellcheck disable=SC2046,SC2086
gcc $flags -DLOCALE_DIR="\"$work/prefix/share/lexicor/locale\"" -o "$work/by_pc" "$work/program/main.c" \
  $(value Cflags) $(value Libs) -Wl,-rpath,"$libdir"
[ "$("$work/by_pc")" = GROß ]

"$work/prefix/bin/lexicor" list codepages >"$work/list"
grep -q 'UTF-8' "$work/list"
"$work/prefix/bin/lexicor-data" check "$work/prefix/share/lexicor/locale"
printf '1 text\n' | "$work/prefix/bin/lexicor-gencat" "$work/installed.cat"
