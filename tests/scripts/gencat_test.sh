#!/bin/bash
# The catalog compiler as its users meet it: the command line, the sample catalogs, and, where the system has a
# gencat of its own, the same texts from the same sources.
# Arguments: source directory, build directory.
set -u
samples=$1/data/samples/catalog
gencat=$2/bin/lexicor-gencat
[ -x "$gencat" ] || exit 77
export LC_ALL=C.UTF-8
unset LX_LOCALEDIR
. "$1/tests/scripts/expect.bash"

# --- Standard input and output, and the ways to name the files.
printf '1 one\n$set 2\n3 three\n' >a.msg
expect 'two files' 0 '' "$gencat" a.cat a.msg
expect 'standard input and output' 0 '' "$gencat" - - <a.msg
same 'standard input and output' out a.cat
expect 'no source named' 0 '' "$gencat" -o b.cat <a.msg
same 'no source named' b.cat a.cat
expect 'dump of standard input' 0 '' "$gencat" --dump - <a.cat
mv out dump.msg
expect 'dump through a pipe' 0 '' "$gencat" c.cat - <dump.msg
same 'dump through a pipe' c.cat a.cat
printf 'msgid "a"\nmsgstr "one"\nmsgctxt "2:3"\nmsgid "b"\nmsgstr "three"\n' >a.po
expect 'a PO file by its name' 0 '' "$gencat" d.cat a.po
same 'a PO file by its name' d.cat a.cat
expect 'a PO file by option' 0 '' "$gencat" --po --new d.cat - <a.po
same 'a PO file by option' d.cat a.cat

# --- Errors: data and files 1, command lines 2; what was there stays.
printf '1 a\n?\n' >bad.msg
says 'a fault' 1 '^bad.msg:2:1: error: expected' "$gencat" a.cat a.msg bad.msg
same 'a fault' a.cat c.cat
says 'no such source' 1 'lexicor-gencat: none: No such file' "$gencat" a.cat none
says 'no such directory' 1 'lexicor-gencat: none/a.cat: No such file' "$gencat" none/a.cat a.msg
says 'a header that cannot be written' 1 'none/a.h' "$gencat" -H none/a.h a.cat a.msg
says 'no catalog' 1 'a.msg: offset 0: the header' "$gencat" --dump a.msg
says 'merging into what is no catalog' 1 'a.msg: offset 0' "$gencat" a.msg - <a.po
says 'no file' 2 'expected CATFILE' "$gencat"
says 'an unknown byte order' 2 'middle' "$gencat" --byte-order middle a.cat a.msg
says 'an unknown codepage' 2 "unknown codepage 'nonesuch'" "$gencat" --from nonesuch a.cat a.msg
says 'an unknown codepage in a source' 1 "standard input: unknown codepage 'nonesuch'" "$gencat" x.cat - <<<'$ codeset=nonesuch'
says 'a dump into a header' 2 'goes with' "$gencat" --dump -H a.h a.cat
says 'a full device' 1 'No space' "$gencat" --dump -o /dev/full a.cat
[ "$(ls)" = "$(printf '%s\n' a.cat a.msg a.po b.cat bad.msg c.cat d.cat dump.msg err out)" ] || fault "files are left: $(ls)"

# --- The samples in the codepages that their languages live in, and back.
for case in english:IBM037 german:IBM273 german:MS1252 japanese:IBM930 japanese:MS932 japanese:JapanEUC russian:KOI8-R \
  russian:IBM1025; do
  IFS=: read -r language codepage <<<"$case"
  expect "$case" 0 '' "$gencat" --new --locale "English_UnitedStates.$codepage" s.cat "$samples/$language.msg"
  for encoding in UTF-8 "$codepage"; do
    expect "$case as $encoding" 0 '' "$gencat" --dump --from "$encoding" -o s.msg s.cat
    expect "$case from $encoding" 0 '' "$gencat" --new --from "$encoding" t.cat s.msg
    same "$case through $encoding" s.cat t.cat
  done
done

# --- The system's gencat makes the same catalog of a source and of the dump of what it was compiled to.
# Left out is where it goes its own way: a number alone, more than three octal digits, $delset. The sets ascend,
# since it stores texts in the order in which their sets begin.
if command -v gencat >/dev/null; then
  cp "$samples"/*.msg .
  awk 'BEGIN {
    srand(7)
    split("a|é|日本|\\n|\\t|\\\\|\\q|\\101|\\60x|\"|\\\"|  |$|#|%d|\\\n|x", piece, "|")
    for (file = 1; file <= 80; ++file) {
      name = "random" file ".msg"; quoted = 0; split("", used); set = 1
      for (line = int(rand() * 12); line >= 0; --line) {
        kind = int(rand() * 10)
        if (kind == 0) { set += int(rand() * 3); print "$set " set " x" >name }
        else if (kind == 1) print "$ comment \"" >name
        else if (kind == 2) { quoted = rand() < 0.7; print quoted ? "$quote \"" : "$quote" >name }
        else {
          number = 1 + int(rand() * 40)
          if (used[set, number]++) continue
          text = ""
          for (count = int(rand() * 6); count > 0; --count) text = text piece[1 + int(rand() * 17)]
          if (quoted) { gsub(/"/, "", text); sub(/\\$/, "", text); text = "\"" text "\"" }
          printf "%d%s%s\n", number, rand() < 0.5 ? " " : "\t", text >name
        }
      }
      close(name)
    }
  }'
  compared=0
  for source in *.msg; do
    case $source in bad.msg | dump.msg) continue ;; esac
    # Sources that the system has complaints about are no measure.
    gencat --new system.cat "$source" 2>/dev/null || continue
    "$gencat" --new own.cat "$source" 2>err || fault "$source: $(cat err)"
    "$gencat" --dump own.cat | gencat --new through.cat -
    same "$source: $(cat "$source")" through.cat system.cat
    compared=$((compared + 1))
  done
  [ "$compared" -gt 60 ] || fault "only $compared sources compared with the system"
fi

[ "$failures" = 0 ]
