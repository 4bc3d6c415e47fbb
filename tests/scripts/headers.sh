#!/usr/bin/env bash
# Every public header compiles alone, as C99, C11 and C++17.
set -euo pipefail
cd "$1"
for header in include/*.h include/lx/*.h; do
  name=${header#include/}
  for standard in c99 c11; do
    echo "#include \"$name\"" | gcc -std=$standard -pedantic-errors -Wall -Wextra -Werror -Iinclude -fsyntax-only -x c -
  done
  echo "#include \"$name\"" | g++ -std=c++17 -pedantic-errors -Wall -Wextra -Werror -Iinclude -fsyntax-only -x c++ -
done
