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
cat >"$work/program/main.c" <<'PROGRAM'
#include <lx.h>
#include <stdio.h>
#include <string.h>

int main(void) {
  char text[64];
  LXLocale *host, *utf8;
  if (LXInit(LOCALE_DIR, NULL, NULL, NULL, LX_NO_DEFAULTS) != LX_OK) return 1;
  host = LXGetLocale("English_UnitedStates.IBM273", 0, NULL);
  utf8 = LXGetLocale("English_UnitedStates.UTF-8", 0, NULL);
  if (host == NULL || utf8 == NULL) return 2;
  LXConvertString(utf8, text, sizeof text, host, "\xC7\xD9\xD6\xA1", 4, LX_TERMINATE);
  if (strcmp(text, "GRO\xC3\x9F") != 0) return 3;
  LXReleaseLocale(host);
  LXReleaseLocale(utf8);
  return LXTerm();
}
PROGRAM
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
"$work/program/build/program"

# The .pc file by hand, so that no package is needed for the check.
package=$(find "$work/prefix" -name lexicor.pc)
value() { sed -n "s/^$1[:=] *//p" "$package" | sed "s|\${libdir}|$libdir|; s|\${includedir}|$work/prefix/include|"; }
libdir=$(dirname "$(dirname "$package")")
# shellcheck disable=SC2046,SC2086
gcc $flags -DLOCALE_DIR="\"$work/prefix/share/lexicor/locale\"" -o "$work/by_pc" "$work/program/main.c" \
  $(value Cflags) $(value Libs) -Wl,-rpath,"$libdir"
"$work/by_pc"

"$work/prefix/bin/lexicor" list codepages >"$work/list"
grep -q 'UTF-8' "$work/list"
"$work/prefix/bin/lexicor-data" check "$work/prefix/share/lexicor/locale"
printf '1 text\n' | "$work/prefix/bin/lexicor-gencat" "$work/installed.cat"
