#!/bin/bash
# The command line as its users meet it: what it writes, what it says and how it exits.
# Arguments: source directory, build directory.
set -u
source_dir=$1
lexicor=$2/bin/lexicor
samples=$source_dir/data/samples
[ -x "$lexicor" ] || exit 77
export LC_ALL=C
unset LX_LOCALEDIR
work=$(mktemp -d) || exit 1
trap 'rm -rf "$work"' EXIT
cd "$work" || exit 1

failures=0
fault() {
  echo "FAILED: $1"
  failures=$((failures + 1))
}

# expect NAME STATUS STDERR COMMAND...: the exit status, and the whole of standard error. Output goes to out.
expect() {
  local name=$1 status=$2 message=$3 actual
  shift 3
  "$@" >out 2>err
  actual=$?
  [ "$actual" = "$status" ] || fault "$name: exit $actual, expected $status"
  [ "$(cat err)" = "$message" ] || fault "$name: standard error is: $(cat err)"
}

# says NAME STATUS PATTERN COMMAND...: the exit status, and a pattern in standard error.
says() {
  local name=$1 status=$2 pattern=$3 actual
  shift 3
  "$@" >out 2>err
  actual=$?
  [ "$actual" = "$status" ] || fault "$name: exit $actual, expected $status"
  grep -q -e "$pattern" err || fault "$name: standard error is: $(cat err)"
}

same() { cmp "$2" "$3" >&2 || fault "$1"; }
# bytes TEXT FILE: a file of the bytes that the escapes of printf stand for.
bytes() { printf "$1" >"$2"; }

# converts NAME FROM TO INPUT OUTPUT: input and expected output as escapes of printf.
converts() {
  bytes "$4" in
  bytes "$5" expected
  expect "$1" 0 '' "$lexicor" convert --from "$2" --to "$3" in
  same "$1" out expected
}

# --- Samples: the bytes of the system's converter, and back.
while read -r sample codepage system; do
  file=$samples/$sample.txt
  expect "$sample to $codepage" 0 '' "$lexicor" convert --from UTF-8 --to "$codepage" --strict -o there "$file"
  expect "$sample from $codepage" 0 '' "$lexicor" convert --from "$codepage" --to UTF-8 --strict -o back there
  same "$sample through $codepage" back "$file"
  if iconv -f UTF-8 -t "$system" "$file" >system 2>/dev/null; then
    same "$sample in $codepage as in $system" there system
  fi
done <<'END'
japanese MS932 CP932
japanese JapanEUC EUC-JP
japanese IBM930 IBM930
japanese IBM939 IBM939
chinese-simplified MS936 CP936
chinese-simplified IBM935 IBM935
chinese-traditional MS950 CP950
chinese-traditional EUC-TW EUC-TW
chinese-traditional IBM937 IBM937
korean MS949 CP949
korean IBM933 IBM933
greek ISO-8859-7 ISO-8859-7
russian MS1251 CP1251
russian KOI8-R KOI8-R
russian IBM1025 IBM1025
hebrew ISO-8859-8 ISO-8859-8
hebrew MS1255 CP1255
thai MS874 CP874
czech ISO-8859-2 ISO-8859-2
czech IBM870 IBM870
german IBM273 IBM273
german IBM1141 IBM1141
english IBM037 IBM037
END

# --- A megabyte, shifted so that every character of the sample meets the end of a piece.
for _ in $(seq 3500); do cat "$samples/japanese.txt"; done >text
for shift in '' x xx; do
  { printf '%s' "$shift" && cat text; } >large
  for pair in MS932:CP932 IBM939:IBM939; do
    name="1 MB to ${pair%:*}, ${#shift} before it"
    expect "$name" 0 '' "$lexicor" convert --from utf-8 --to "${pair%:*}" --strict -o there large
    iconv -f UTF-8 -t "${pair#*:}" large >system && same "$name" there system
    expect "$name, back" 0 '' "$lexicor" convert --from "${pair%:*}" --to utf-8 --strict there
    same "$name, back" out large
  done
done

# --- Names: an object name, an identifier and an alias, in any case.
bytes '\xe3\x81\x82' in
bytes '\x0e\x44\x81\x0f' expected
for name in IBM930 ibm930 930 ibm-930 CP930 ccsid930; do
  expect "codepage $name" 0 '' "$lexicor" convert --from uTf-8 --to "$name" in
  same "codepage $name" out expected
done

# --- Shift states: output ends in the single-byte state, and so does what only looks like it.
converts 'empty text' UTF-8 IBM930 '' ''
converts 'single-byte end' UTF-8 IBM930 '\xe3\x81\x82A' '\x0e\x44\x81\x0f\xc1'
converts 'unclosed input' IBM930 IBM939 '\x0e\x44\x81' '\x0e\x44\x81\x0f'
converts 'input of a Shift-Out' IBM930 IBM939 '\xc1\x0e' '\xc1'
converts 'meeting fields' IBM930 MS932 '\x0e\x44\x81\x0f\x0e\x44\x81\x0f\xc1\xc1\xc1\xc1\xc1\xc1\xc1\xc1' \
  '\x82\xa0\x82\xa0AAAAAAAA'

# --- Standard input and several files are one text.
bytes 'a\xe3\x81' part1
bytes '\x82b' part2
bytes 'a\x82\xa0b' expected
expect 'files' 0 '' "$lexicor" convert --from utf8 --to ms932 part1 part2
same 'files' out expected
expect 'file and standard input' 0 '' "$lexicor" convert --from utf8 --to ms932 part1 - <part2
same 'file and standard input' out expected
expect 'standard input' 0 '' "$lexicor" convert --from utf8 --to ms932 < <(cat part1 part2)
same 'standard input' out expected

# --- Strict: each loss, and nothing that is none.
bytes 'A\xe2\x82\xac\xf0\x9f\x98\x80\xff\xef\xbf\xbd\xc3\x41?' in
expect 'losses' 1 'lexicor: 5 characters lost from utf8 to latin1
  byte 1: U+20AC, which Latin1 lacks
  byte 4: U+1F600, which has no 16-bit Unicode value
  byte 8: byte FF, no character in UTF-8
  byte 9: U+FFFD, which Latin1 lacks
  byte 12: bytes C3 41, no character in UTF-8' "$lexicor" convert --from utf8 --to latin1 --strict in
expect 'losses are no error without --strict' 0 '' "$lexicor" convert --from utf8 --to latin1 in
bytes 'a\xc3\x41' in
expect 'a malformed character alone' 1 'lexicor: 1 character lost from utf8 to utf8
  byte 1: bytes C3 41, no character in UTF-8' "$lexicor" convert --from utf8 --to utf8 --strict in
bytes 'a\x81\xad\x82\xa0?' in
expect 'a source character without a value' 1 'lexicor: 1 character lost from MS932 to UTF-8
  byte 1: bytes 81 AD, no character in MS932' "$lexicor" convert --from MS932 --to UTF-8 --strict in
bytes '\xc1\x0e\x44\x81\x0f\xc1\x0e\x44\x82' in
expect 'places in shift-sensitive text' 1 'lexicor: 2 characters lost from 930 to 367
  byte 2: U+3042, which US-ASCII lacks
  byte 7: U+3044, which US-ASCII lacks' "$lexicor" convert --from 930 --to 367 --strict in
bytes '?\x1a\xef\xbf\xbd' in
expect 'U+FFFD itself' 0 '' "$lexicor" convert --from UTF-8 --to UTF-8 --strict in
bytes '?\x1a\xe3\x81\x82' in
for codepage in MS932 EUC-TW IBM930; do
  expect "substitution characters themselves, $codepage" 0 '' \
    "$lexicor" convert --from UTF-8 --to "$codepage" --strict in
done
{ head -c 65533 /dev/zero | tr '\0' a && printf '\xf0\x9f\x98\x80' && head -c 70000 /dev/zero | tr '\0' a &&
  printf '%.0s\xe2\x82\xac' $(seq 12); } >in
expect 'losses in later pieces' 1 'lexicor: 13 characters lost from UTF-8 to Latin1
  byte 65533: U+1F600, which has no 16-bit Unicode value
'"$(for i in $(seq 0 8); do echo "  byte $((135537 + 3 * i)): U+20AC, which Latin1 lacks"; done)"'
  and 3 more' "$lexicor" convert --from UTF-8 --to Latin1 --strict in
bytes 'abc' plain
bytes 'd\xe2\x82\xac' euro
expect 'losses in several files' 1 'lexicor: 1 character lost from UTF-8 to Latin1
  euro, byte 1: U+20AC, which Latin1 lacks' "$lexicor" convert --from UTF-8 --to Latin1 --strict plain euro

# --- Input that ends inside a character.
bytes 'ab\xe3\x81' in
expect 'cut input' 1 'lexicor: the input ends inside the character that begins at byte 2' \
  "$lexicor" convert --from UTF-8 --to MS932 in
{ head -c 65535 /dev/zero | tr '\0' a && printf '\xe3\x81'; } >in
expect 'input cut behind a piece' 1 'lexicor: the input ends inside the character that begins at byte 65535' \
  "$lexicor" convert --from UTF-8 --to MS932 in
bytes '\xc1\x0e\x44\x81\x44' in
expect 'cut double-byte input' 1 'lexicor: the input ends inside the character that begins at byte 4' \
  "$lexicor" convert --from 930 --to UTF-8 in
expect 'cut input of several files' 1 'lexicor: the input ends inside the character that begins at part1, byte 1' \
  "$lexicor" convert --from UTF-8 --to MS932 plain part1

# --- The output file changes only when the conversion is complete, and then keeps its mode and its link.
bytes 'ab\xe3\x81' cut
printf 'old' >old && chmod 640 old && ln -s old link
for arguments in '--from UTF-8 --to MS932 cut' '--from UTF-8 --to Latin1 --strict euro' '--from UTF-8 --to Latin1 none'; do
  "$lexicor" convert $arguments -o old 2>err && fault "$arguments: no error"
  [ "$(cat old)" = old ] || fault "$arguments: the output file changed"
done
expect 'output through a link' 0 '' "$lexicor" convert --from UTF-8 --to Latin1 -o link plain
[ "$(cat old)" = abc ] && [ -L link ] || fault 'output through a link'
[ "$(stat -c %a old)" = 640 ] || fault 'mode of the output file'
expect 'a file onto itself' 0 '' "$lexicor" convert --from UTF-8 --to 037 -o old old
same 'a file onto itself' old <(printf '\x81\x82\x83')
ls old.* link.* none* >/dev/null 2>&1 && fault 'a temporary file is left'

# --- Errors: data and files 1, command lines 2.
says 'near names' 2 "unknown codepage 'MS93'; did you mean MS932, .* or .*?" "$lexicor" convert --from MS93 --to utf8
says 'near alias' 2 'did you mean SHIFT-JIS' "$lexicor" convert --from shift+jis --to utf8
says 'no near name' 2 'lexicor list codepages' "$lexicor" convert --from xyzzyplugh --to utf8
says 'identifier that is none' 2 "unknown codepage '70000'" "$lexicor" convert --from 70000 --to utf8
says 'no --to' 2 'to is required' "$lexicor" convert --from utf8
says 'no subcommand' 2 'subcommand is required' "$lexicor"
says 'unknown list' 2 'wat' "$lexicor" list wat
says 'unknown option' 2 '--jsn' "$lexicor" list --jsn
expect 'no input file' 1 'lexicor: none: No such file or directory' "$lexicor" convert --from utf8 --to 037 none
expect 'a directory' 1 'lexicor: .: Is a directory' "$lexicor" convert --from utf8 --to 037 .
expect 'no output directory' 1 'lexicor: none/out: No such file or directory' \
  "$lexicor" convert --from utf8 --to 037 -o none/out plain
for arguments in 'convert --from utf8 --to 037 plain' 'list' '--help' '--version'; do
  "$lexicor" $arguments >/dev/full 2>err && fault "$arguments: a full device is no error"
  [ "$(cat err)" = 'lexicor: standard output: No space left on device' ] || fault "$arguments: $(cat err)"
done
expect 'a full device' 1 'lexicor: /dev/full: No space left on device' \
  "$lexicor" convert --from utf8 --to 037 -o /dev/full plain
for arguments in 'convert --from utf8 --to 037' 'list aliases'; do
  yes | head -c 1000000 | { "$lexicor" $arguments 2>err; echo $? >status; } | head -c 5 >/dev/null
  [ ! -s err ] || fault "$arguments: a closed pipe says $(cat err)"
  [ -s status ] || fault "$arguments: no status"
done
[ "$("$lexicor" --version)" = 'lexicor 1.0.0' ] || fault 'version'
for command in '' convert list; do
  "$lexicor" $command --help | grep -q 'Examples:' || fault "help of '$command'"
done

# --- The locale directory: the option, then the variable, then beside the program; else the built-in objects.
expect 'the option before the variable' 0 '' \
  env LX_LOCALEDIR=none "$lexicor" convert --locale-dir "$2/locale" --from utf8 --to 037 plain
expect 'the variable' 0 '' env LX_LOCALEDIR="$2/locale" "$lexicor" convert --from utf8 --to 037 plain
expect 'no directory where the option says' 1 'lexicor: none/control.nls: No such file or directory' \
  "$lexicor" --locale-dir none list
says 'built-in objects' 0 'no usable locale directory in LX_LOCALEDIR=none (file not found)' \
  env LX_LOCALEDIR=none "$lexicor" convert --from us-ascii --to 1 plain
same 'built-in objects' out plain
says 'not built in' 1 '--locale-dir DIR' env LX_LOCALEDIR=none "$lexicor" convert --from us-ascii --to MS932 plain
mkdir broken && cp "$2/locale/control.nls" "$2/locale/la_00001.nls" "$2/locale/te_00840.nls" \
  "$2/locale/cp_00367.nls" broken && printf 'damaged' >broken/cp_00037.nls
says 'a damaged object is not replaced silently' 1 'codepage IBM037 cannot be loaded' \
  "$lexicor" --locale-dir broken convert --from us-ascii --to 037 plain
says 'a missing object is not replaced silently' 1 'codepage UTF-8 cannot be loaded: file not found' \
  "$lexicor" --locale-dir broken convert --from us-ascii --to utf-8 plain
head -c 100 /dev/zero >broken/control.nls
says 'a damaged control file' 0 'in broken (the file is damaged' "$lexicor" --locale-dir broken list
grep -q '^ *1  US-ASCII$' out || fault 'the built-in codepage is not listed'

# --- Lists.
"$lexicor" list >out || fault 'list'
[ "$(grep -c '^[a-z]' out)" = 4 ] || fault 'the tables of the whole list'
[ "$(awk 'length > 100' out | wc -l)" = 0 ] || fault 'a line of the list is longer than 100 columns'
"$lexicor" list codepages | grep -q '^ *930  IBM930  .*IBM-930' || fault 'a codepage with its aliases'
"$lexicor" list languages | grep -q '^ *1  English$' || fault 'a language'
"$lexicor" list territories | grep -q '^ *840  UnitedStates$' || fault 'a territory'
"$lexicor" list sorts | grep -q '^ *0  BINARY$' || fault 'binary order'
"$lexicor" list aliases | grep -q '^CP932 *MS932$' || fault 'an alias'
"$lexicor" list --json | python3 -c '
import json, sys
lists = json.load(sys.stdin)
assert list(lists) == ["codepages", "languages", "territories", "sorts"], list(lists)
ms932 = [row for row in lists["codepages"] if row["name"] == "MS932"]
assert len(ms932) == 1 and ms932[0]["id"] == 932 and "CP932" in ms932[0]["aliases"], ms932
' || fault 'the list as JSON'

[ "$failures" = 0 ] || exit 1
echo 'The command line does what it says.'
