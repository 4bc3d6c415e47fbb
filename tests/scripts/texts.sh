#!/bin/bash
# Real and long texts through the command-line programs, beside the system's own iconv and gencat; and the commands
# of the README, of helps and of manuals. What the programs write and say about small texts stands in tests/cases/cli.
# Arguments: source directory, build directory.
set -euE -o pipefail
source_dir=$1 build_dir=$2 samples=$1/data/samples
lexicor=$2/bin/lexicor gencat=$2/bin/lexicor-gencat
[ -x "$lexicor" ] || exit 77
export LC_ALL=C.UTF-8
unset LX_LOCALEDIR
work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT
cd "$work"
trap 'echo "FAILED: line $LINENO: $BASH_COMMAND ${command:-}" >&3; cat "$work/said" >&3' ERR
exec 3>&2 2>said

convert() { "$lexicor" convert --strict --from "$1" --to "$2" "${@:3}"; }

# --- A megabyte, shifted so that every character of the sample meets the end of a piece.
repeated() { yes "$(cat "$1")" | head -n $((3500 * $(wc -l <"$1"))) || [ $? = 141 ]; }
repeated "$samples/japanese.txt" >text
"$lexicor" translate --from UTF-8 --to IBM939 text | cmp - <(convert UTF-8 IBM939 text)
for shift in '' x xx; do
  { printf '%s' "$shift" && cat text; } >large
  for pair in MS932:CP932 IBM939:IBM939; do
    convert utf-8 "${pair%:*}" large >there
    cmp there <(iconv -f UTF-8 -t "${pair#*:}" large)
    convert "${pair%:*}" utf-8 there | cmp - large
  done
  for mapping in half full upper; do
    "$lexicor" map "$mapping" "$samples/japanese.txt" >sample
    "$lexicor" map "$mapping" -o mapped --codepage IBM939 there
    [ "$mapping" != upper ] || [ "$(stat -c %s there)" = "$(stat -c %s mapped)" ]
    if LC_ALL=C grep -qaP '[\x0e\x0f]{2}' mapped; then echo 'two shift bytes in a row' >&2 && false; fi
    convert IBM939 UTF-8 mapped | cmp - <(printf '%s' "$shift" | "$lexicor" map "$mapping" && repeated sample)
  done
done

[ ! -s said ]

# --- The README's commands do as they are written, in the source directory; compare answers by its exit code.
while read -r command; do
  command=${command// \/tmp\// $work/}
  (cd "$source_dir" && eval "${command/#build\/m64/$build_dir}") >out || [[ $command == *' compare '* && $? -ge 3 ]]
done < <(grep '^build/m64/bin/' "$source_dir/README.md")

# --- The examples of helps and manuals, where the files that they name are; nothing is lost on the way. The build compiles
# the data.
mkdir examples && cd examples
cp "$samples/german.txt" letter.txt
cp "$samples/german.txt" part1.txt
cp "$samples/german.txt" part2.txt
cp "$samples/japanese.txt" letter.utf8
cp "$samples/catalog/japanese.msg" app.msg
printf 'Zebra\nApfel\n' | tee names.txt words.txt field.utf8 >name.txt
printf 'Anna;Zuse\nBert;Abel\n' >people.csv
printf 'msgid "yes"\nmsgstr "ja"\n' >de.po
convert UTF-8 MS932 letter.utf8 >letter.sjis
convert UTF-8 IBM930 letter.utf8 >host.txt
convert UTF-8 UTF-16LE --bom=add letter.txt >notes.txt
printf '%-79s\n' Zuse Abel | tr '\n' ' ' | convert UTF-8 IBM939 >names.dat
ln -s "$build_dir/locale" locale
mkdir -p cats/DE_DEU && "$gencat" cats/DE_DEU/app.cat app.msg
{
  for program in "$build_dir"/bin/lexicor{-gencat,}; do
    "$program" --help
    for command in $("$program" --help | sed -n '/^Subcommands:/,/^$/s/^  \([a-z-]*\) .*/\1/p'); do "$program" "$command" --help; done
  done | sed -n 's/^  \(lexicor[a-z-]* .*\)/\1/p'
  sed -n '/^# EXAMPLES/,/^# S/{/^lexicor/p}' "$source_dir"/man/*.scd
} | awk '!seen[$0]++' | grep -v '^lexicor-data compile' >commands
while read -r command; do
  (PATH=$build_dir/bin:$PATH && eval "$command") >out || [[ $command == *' compare '* && $? -ge 3 ]]
done <commands
[ "$(wc -l <commands)" -gt 40 ]
cd ..

# --- The system's gencat makes the same catalog of a source and of the dump of what it was compiled to.
# Left out is where it goes its own way: a number alone, more than three octal digits, $delset. The sets ascend,
# since it stores texts in the order in which their sets begin.
command -v gencat >/dev/null || exit 0
mkdir sources && cp "$samples"/catalog/*.msg sources
csplit -sz -f sources/random -b %d.msg "$source_dir/tests/cases/gencat_sources.msg" '/^\$ --- /' '{*}'
compared=0
for source in sources/*.msg; do
  # Sources that the system has complaints about are no measure.
  gencat --new system.cat "$source" 2>/dev/null || continue
  "$gencat" --new own.cat "$source"
  "$gencat" --dump own.cat | gencat --new through.cat -
  cmp through.cat system.cat
  compared=$((compared + 1))
done
[ "$compared" -gt 60 ]
