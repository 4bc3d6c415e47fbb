#!/usr/bin/env bash
# Lexicor serves programs in C and in C++ in each way of getting it: installed and moved, by pkg-config and by CMake
# package; and as a part of their own project, static, without tools and data. What was installed goes again.
set -euo pipefail
source_dir=$1 build_dir=$2
# A sanitizer build is not one to install.
if grep -qE '__(asan|tsan|ubsan)_' < <(nm -D --undefined-only "$build_dir/lib/liblexicor.so"); then exit 77; fi

work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT
cd "$work"
fail() { echo "install: $*" >&2; exit 1; }
flags=$(grep '^CMAKE_C_FLAGS:' "$build_dir/CMakeCache.txt" | cut -d= -f2-)

# The program of the README, which must say what it converts, and the same words as C++.
mkdir program
sed -n '/^```c$/,/^```$/{/^```/d;s|"build/m64/locale"|LOCALE_DIR|;p}' "$source_dir/README.md" >program/main.c
cp program/main.c program/main.cpp
cat >program/CMakeLists.txt <<'PROGRAM'
cmake_minimum_required(VERSION 3.25)
project(program C CXX)
if(LEXICOR_SOURCE)
  include(FetchContent)
  FetchContent_Declare(lexicor SOURCE_DIR ${LEXICOR_SOURCE})
  FetchContent_MakeAvailable(lexicor)
else()
  find_package(Lexicor 1 REQUIRED)
endif()
add_executable(in_c main.c)
add_executable(in_cpp main.cpp)
foreach(program in_c in_cpp)
  target_compile_definitions(${program} PRIVATE LOCALE_DIR="$<IF:$<BOOL:${DATA}>,${DATA},${LEXICOR_LOCALE_DIR}>")
  target_link_libraries(${program} PRIVATE Lexicor::lexicor)
endforeach()
PROGRAM
# Both programs, as a CMake project: build directory, options.
by_cmake() {
  cmake -S program -B "$1" -G Ninja -DCMAKE_C_FLAGS="$flags" -DCMAKE_CXX_FLAGS="$flags -O0" "${@:2}" >said &&
    cmake --build "$1" >said || { cat said >&2 && fail "$1 cannot be built"; }
  runs "$1/in_c" "$1/in_cpp"
}
nothing_in() { [ -z "$(find "$1" -type f -o -name '*lexicor*')" ] || fail "left behind: $(find "$1" -type f -o -name '*lexicor*')"; }
runs() { for program; do [ "$("$program")" = GROß ] || fail "$program"; done; }

# --- Installed, and moved.
cmake --install "$build_dir" --prefix "$work/first" >/dev/null
mv first prefix
[ -s prefix/share/doc/lexicor/LICENSE ] && [ -s prefix/share/doc/lexicor/docs/limits.md ] || fail 'no licence, no docs'
! type scdoc >/dev/null 2>&1 || [ -s prefix/share/man/man1/lexicor.1 ] || fail 'no manual'
by_cmake by_package -DCMAKE_PREFIX_PATH="$work/prefix"

PKG_CONFIG_PATH=$(dirname "$(find prefix -name lexicor.pc)")
export PKG_CONFIG_PATH
package() { pkg-config "$@" lexicor; }
for compiler in 'gcc -x c' 'g++ -x c++'; do
  # shellcheck disable=SC2046,SC2086
  $compiler $flags program/main.c -x none -DLOCALE_DIR="\"$(package --variable=localedir)\"" $(package --cflags --libs) \
    -Wl,-rpath,"$(package --variable=libdir)" -o by_pc
  runs ./by_pc
done

prefix/bin/lexicor list codepages >list
grep -q 'UTF-8' list
prefix/bin/lexicor-data check prefix/share/lexicor/locale
printf '1 text\n' | prefix/bin/lexicor-gencat installed.cat
for python in $([ -z "$flags" ] && type -P /usr/bin/python3); do  # of the word size of the system's
  said=$(LEXICOR_LIBRARY=$(find "$PWD/prefix" -name liblexicor.so.1) PYTHONPATH=prefix/lib/python3/dist-packages \
    PYTHONDONTWRITEBYTECODE=1 "$python" -c 'import lexicor; print(b"\xC7\xD9\xD6\xA1".decode("lexicor-ibm273"))')
  [ "$said" = GROß ] || fail "Python: $said"
done

if [ -z "$flags" ] && [ -e prefix/lib/sqlite3/lexicor.so ] && type sqlite3 >/dev/null 2>&1; then
  said=$(sqlite3 :memory: ".load prefix/lib/sqlite3/lexicor" "SELECT lexicor_convert(x'C7D9D6A1', 'IBM273', 'UTF-8')")
  [ "$said" = GROß ] || fail "SQLite: $said"
fi

cmake --install "$build_dir" --prefix "$work/second" >/dev/null
cmake --build "$build_dir" --target uninstall >/dev/null
nothing_in second

# --- As a part of another project. Building the library anew takes a while: `./check trust` does.
[ -n "${LEXICOR_TRUST:-}" ] || exit 0
by_cmake inside -DLEXICOR_SOURCE="$source_dir" -DBUILD_SHARED_LIBS=OFF -DLEXICOR_INSTALL=ON -DDATA="$build_dir/locale"
[ ! -e inside/_deps/lexicor-build/bin ] || fail 'tools, which nobody asked for'
archive=inside/_deps/lexicor-build/lib/liblexicor.a
nm -g --defined-only --format=just-symbols "$archive" | grep -v -e '^$' -e ':$' | LC_ALL=C sort |
  diff -u "$source_dir/cmake/exports.txt" - || fail 'a static library shows what it should hide'

# --- The static library installed, without tools and data; a package of it is still one. Then all of it goes.
cmake --install inside --prefix "$work/static" >/dev/null
by_cmake by_static_package -DCMAKE_PREFIX_PATH="$work/static" -DDATA="$build_dir/locale"
PKG_CONFIG_PATH=$(dirname "$(find static -name lexicor.pc)")
# shellcheck disable=SC2046
gcc program/main.c -DLOCALE_DIR="\"$build_dir/locale\"" $(package --static --cflags --libs) -o by_static_pc
runs ./by_static_pc
(cd inside && cmake -P "$source_dir/cmake/uninstall.cmake")
nothing_in static
