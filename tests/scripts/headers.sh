#!/usr/bin/env bash
# Every public header compiles alone, as C99, C11 and C++17; that of C++ as C++17 and C++20.
set -euo pipefail
cd "$1"
for header in include/*.h include/lx/*.h; do
  name=${header#include/}
  for standard in c99 c11; do
    echo "#include \"$name\"" | gcc -std=$standard -pedantic-errors -Wall -Wextra -Werror -Iinclude -fsyntax-only -x c -
  done
  echo "#include \"$name\"" | g++ -std=c++17 -pedantic-errors -Wall -Wextra -Werror -Iinclude -fsyntax-only -x c++ -
done
for standard in c++17 c++20; do
  echo '#include "lexicor.hpp"' |
    g++ -std=$standard -pedantic-errors -Wall -Wextra -Wconversion -Wshadow -Werror -Iinclude -fsyntax-only -x c++ -
done
