#!/usr/bin/env bash
# The sources are as clang-format writes them. Skipped where it is of another version than the one that made them so.
set -euo pipefail
[[ "$(clang-format --version 2>/dev/null)" == *'version 14.'* ]] || exit 77
cd "$1"
find src include tools tests fuzz bench bindings -name '*.h' -o -name '*.hpp' -o -name '*.c' -o -name '*.cpp' |
  xargs -P "$(nproc)" -n 20 clang-format --dry-run -Werror
