#!/usr/bin/env bash
# Programs that were built with a release run with this library, in this word size.
set -euo pipefail
"$1/scripts/abi" --flags="$(grep '^CMAKE_C_FLAGS:' "$2/CMakeCache.txt" | cut -d= -f2-)"
