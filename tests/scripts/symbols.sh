#!/usr/bin/env bash
# The shared library exports exactly the public names, and needs libc and libm only.
set -euo pipefail
source_dir=$1 build_dir=$2
library=$build_dir/lib/liblexicor.so

exported=$(nm -D --defined-only "$library" | awk '{print $3}' | sed 's/@.*//' | grep -v '^LEXICOR_' | LC_ALL=C sort)
diff -u --label cmake/exports.txt --label exported "$source_dir/cmake/exports.txt" <(echo "$exported")

# Every exported name is declared for callers, and every declared function is exported.
declared=$(cat "$source_dir"/include/lx/*.h "$source_dir"/include/*.h | tr '\n' ' ' | grep -oE 'LX_API [^;(]*\(' |
  grep -oE '[A-Za-z0-9_]+\($' | tr -d '(' | grep -v '^__attribute__' | LC_ALL=C sort -u)
diff -u --label declared --label exported <(echo "$declared") <(echo "$exported")

soname=$(readelf -d "$library" | sed -n 's/.*SONAME.*\[\(.*\)\]/\1/p')
[ "$soname" = liblexicor.so.1 ] || { echo "symbols: soname is $soname" >&2; exit 1; }

# A sanitizer build needs its runtime.
undefined=$(nm -D --undefined-only "$library")
if grep -qE '__(asan|tsan|ubsan)_' <<<"$undefined"; then exit 0; fi
needed=$(readelf -d "$library" | sed -n 's/.*NEEDED.*\[\(.*\)\]/\1/p' | grep -vE '^(libc|libm)\.so' || true)
[ -z "$needed" ] || { echo "symbols: needs $needed" >&2; exit 1; }
# A privileged program ignores its caller's environment.
if grep -qw 'U getenv' <<<"$undefined"; then echo 'symbols: getenv is not secure' >&2; exit 1; fi
runtime=$(awk '{print $2}' <<<"$undefined" | grep -E '^(_Z|__cxa_(throw|begin|end|guard|pure|alloc)|__gxx)' || true)
[ -z "$runtime" ] || { echo "symbols: C++ runtime symbols: $runtime" >&2; exit 1; }
