#!/usr/bin/env bash
# Includes run one way: platform < core < codepage < locale < text < collate < format, stream, catalog < nls1; the command
# line sees public headers only.
set -euo pipefail
cd "$1"

bad=0
complain() { echo "$1" >&2; bad=1; }

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
  while IFS=: read -r file line text; do
    included=${text#*\"}; included=${included%%/*}
    case " ${below[$room]} lx lx.h\" nls1.h\" " in
      *" $included "*) ;;
      *) complain "$file:$line: src/$room may not include $text" ;;
    esac
  done < <(grep -rn '^#include "' "src/$room" || true)
done

while IFS=: read -r file line text; do
  case "$text" in
    *'"lx.h"'* | *'"lx/'* | *'"nls1.h"'*) ;;
    *)
      header=${text#*\"}; header=${header%\"*}
      [ -f "tools/lexicor/$header" ] || complain "$file:$line: the command line uses public headers only, not $text"
      ;;
  esac
done < <(grep -rn '^#include "' tools/lexicor --include='*.cpp' --include='*.h' || true)

# The library itself: no C++ containers, exceptions, new or run-time types.
while IFS= read -r hit; do complain "$hit: src/ uses libc only"; done < <(
  grep -rnE '^#include <(string|vector|map|memory|algorithm|array|iostream|functional|optional|thread|mutex)>' src || true)
exit "$bad"
