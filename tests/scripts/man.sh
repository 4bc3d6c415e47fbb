#!/usr/bin/env bash
# The pages of section 1 name the options that the programs have, command by command; every page can be made, and read
# without a warning; pages that they name are there, and one for each exported function.
set -euo pipefail
source_dir=$1 build_dir=$2
work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT
fail() { echo "man: $*" >&2; exit 1; }

# The options in the first column of a help; its commands, which stand behind them.
options_of() { sed -n '/^Options:/,/^$/s/^ *\(-[^ ]*\).*/\1/p' | sed 's/{[^}]*}//g; s/:.*//' | tr ',' '\n' | sort -u; }
commands_of() { sed -n '/^Subcommands:/,/^$/s/^  \([a-z-]*\) .*/\1/p'; }
# The options that a section of a page marks as such.
marked() { grep -oE '\*-[^*]+\*' | tr -d '*' | sed 's/=.*//' | sort -u; }
section() { sed -n "/^##* $2\$/,/^#/{/^#/d;p}" "$1"; }

for program in lexicor lexicor-data lexicor-gencat; do
  page=$source_dir/man/$program.1.scd
  "$build_dir/bin/$program" --help >"$work/help"
  diff -u --label "$program --help" --label "$page" <(options_of <"$work/help") <(section "$page" OPTIONS | marked)
  for command in $(commands_of <"$work/help"); do
    diff -u --label "$program $command --help" --label "$page" \
      <("$build_dir/bin/$program" "$command" --help | options_of | grep -vx -e -h -e --help || true) \
      <(section "$page" "$command" | marked || true)
  done
  sections=$(grep -c '^## ' "$page" || true) commands=$(commands_of <"$work/help" | wc -l)
  [ "$sections" -eq "$commands" ] || fail "$page has $sections commands, and the program $commands"
done

type scdoc man doxygen >/dev/null 2>&1 || exit 77
mkdir -p "$work/man"/man{1,3,5,7}
for page in "$source_dir"/man/*.scd; do
  name=$(basename "$page" .scd)
  scdoc <"$page" >"$work/man/man${name##*.}/$name" || fail "$page"
done
sh "$source_dir/cmake/reference.sh" "$build_dir/Doxyfile" "$work/reference"
mv "$work"/reference/man/man3/* "$work/man/man3"

named=$(grep -ohE '\*[a-z_.0-9-]+\*\([1-9]\)' "$source_dir"/man/*.scd | tr -d '*()' | sed 's/.$/.&/')
for name in $named $(sed 's/$/.3/' "$source_dir/cmake/exports.txt"); do
  [ -s "$work/man/man${name##*.}/$name" ] || fail "there is no page $name"
done
for page in "$work"/man/man*/*; do
  case $(head -c 3 "$page") in .so) continue ;; esac
  said=$(cd "$work/man" && MANWIDTH=80 man --warnings=w -l "$page" 2>&1 >/dev/null) && [ -z "$said" ] || fail "$page: $said"
done
