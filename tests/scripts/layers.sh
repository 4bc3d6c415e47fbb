#!/usr/bin/env bash
# Includes and symbols run one way: platform < core < codepage < locale < text < collate < format, stream, catalog < nls1;
# the command line sees public headers only, and the door by which it compiles a user's rules.
set -euo pipefail
cd "$1"

bad=0
complain() { echo "$1" >&2; bad=1; }
# The quoted includes of a folder: file, line and header.
includes() { grep -rnoP '^#include "\K[^"]+' "$1" --include='*.cpp' --include='*.h' || true; }

declare -A below=(
  [platform]="platform"
  [core]="platform core"
  [codepage]="platform core codepage"
  [locale]="platform core codepage locale"
  [text]="platform core codepage locale text"
  [collate]="platform core codepage locale text collate"
  [format]="platform core codepage locale text collate format"
  [stream]="platform core codepage locale text collate stream"
  [catalog]="platform core codepage locale text collate catalog"
  [nls1]="platform core codepage locale text collate format stream catalog nls1"
)
for room in src/*/; do
  room=$(basename "$room")
  [ -n "${below[$room]:-}" ] || { complain "src/$room: a room that the layers do not know"; continue; }
  while IFS=: read -r file line header; do
    case " ${below[$room]} lx lx.h nls1.h " in
      *" ${header%%/*} "*) ;;
      *) complain "$file:$line: src/$room may not include $header" ;;
    esac
  done < <(includes "src/$room")
done

# Symbols: what a room leaves undefined may stand in it, below it, or outside. Of what stands above all rooms the
# linker puts in the table of object types, which core knows by name.
objects="$2/src/CMakeFiles/lexicor_objects.dir"
defined() { nm -g --defined-only --format=just-symbols "$@" | grep -v ':$' | sort -u; }
objects_of() { for source in "src/$1"/*.cpp; do echo "$objects/$1/$(basename "$source").o"; done; }
for room in "${!below[@]}"; do
  [ "$room" != platform ] || continue
  for other in . "${!below[@]}"; do
    case " platform ${below[$room]} " in *" $other "*) continue ;; esac
    while read -r symbol; do
      symbol=$(c++filt "$symbol")
      [ "$room $other $symbol" = 'core . lx::kObjectTypes' ] || complain "src/$room uses $symbol of src/$other"
    done < <(comm -12 <(nm -u --format=just-symbols $(objects_of "$room") | grep -v ':$' | sort -u) \
                      <(defined $(objects_of "$other")))
  done
done

while IFS=: read -r file line header; do
  case "$header" in
    lx.h | lx/* | nls1.h | lexicor-data/rules_directory.h) ;;
    *) [ -f "tools/lexicor/$header" ] || complain "$file:$line: the command line uses public headers only, not $header" ;;
  esac
done < <(includes tools/lexicor)

# The library itself: no C++ containers, exceptions, new or run-time types.
while IFS= read -r hit; do complain "$hit: src/ uses libc only"; done < <(
  grep -rnE '^#include <(string|vector|map|memory|algorithm|array|iostream|functional|optional|thread|mutex)>' src || true)
# Memory comes from the hooks: what takes it from the system, or lets libc take some, is the pair of default hooks, and
# the moment in which the system's locale is another.
allocators='(malloc|calloc|realloc|reallocarray|posix_memalign|aligned_alloc|free|strn?dup|v?asprintf|f?open(64|at)?dir|fopen(64)?|fdopen|getline|getdelim|newlocale|setlocale|qsort|_Zn[wa].*)'
while read -r file symbol; do
  case "$file $symbol" in
    'lxinit.cpp malloc' | 'lxinit.cpp free' | 'lxnative.cpp setlocale' | 'qrlnls1.cpp setlocale') ;;
    *) complain "$file uses $symbol, not the hooks" ;;
  esac
done < <(for object in $(find "$objects" -name '*.o'); do
  nm -u --format=just-symbols "$object" | grep -xE "$allocators" | sed "s|^|$(basename "$object" .o) |" || true
done)
exit "$bad"
