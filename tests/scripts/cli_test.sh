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
. "$source_dir/tests/scripts/expect.bash"

# convert NAME STATUS STDERR FROM TO ARGUMENTS...
convert() { expect "$1" "$2" "$3" "$lexicor" convert --from "$4" --to "$5" "${@:6}"; }

# converts NAME FROM TO INPUT OUTPUT: input and expected output as escapes of printf.
converts() {
  bytes "$4" in
  bytes "$5" expected
  convert "$1" 0 '' "$2" "$3" in
  same "$1" out expected
}

# --- Samples: the bytes of the system's converter, and back.
for case in japanese:MS932:CP932 japanese:JapanEUC:EUC-JP japanese:IBM939:IBM939 chinese-simplified:MS936:CP936 \
  chinese-traditional:EUC-TW:EUC-TW korean:MS949:CP949 russian:MS1251:CP1251 hebrew:MS1255:CP1255 \
  thai:MS874:CP874 german:IBM1141:IBM1141; do
  IFS=: read -r sample codepage system <<<"$case"
  file=$samples/$sample.txt
  convert "$sample to $codepage" 0 '' UTF-8 "$codepage" --strict -o there "$file"
  convert "$sample from $codepage" 0 '' "$codepage" UTF-8 --strict -o back there
  same "$sample through $codepage" back "$file"
  if iconv -f UTF-8 -t "$system" "$file" >system 2>/dev/null; then
    same "$sample in $codepage as in $system" there system
  fi
done

# --- A megabyte, shifted so that every character of the sample meets the end of a piece.
for _ in $(seq 3500); do cat "$samples/japanese.txt"; done >text
for shift in '' x xx; do
  { printf '%s' "$shift" && cat text; } >large
  for pair in MS932:CP932 IBM939:IBM939; do
    name="1 MB to ${pair%:*}, ${#shift} before it"
    convert "$name" 0 '' utf-8 "${pair%:*}" --strict -o there large
    iconv -f UTF-8 -t "${pair#*:}" large >system && same "$name" there system
    convert "$name, back" 0 '' "${pair%:*}" utf-8 --strict there
    same "$name, back" out large
  done
done

# --- Names: an object name, an identifier and an alias, in any case.
bytes '\xe3\x81\x82' in
bytes '\x0e\x44\x81\x0f' expected
for name in ibm930 930 ibm-930 CP930; do
  convert "codepage $name" 0 '' uTf-8 "$name" in
  same "codepage $name" out expected
done

# --- Shift states: output ends in the single-byte state, and so does what only looks like it.
converts 'single-byte end' UTF-8 IBM930 '\xe3\x81\x82A' '\x0e\x44\x81\x0f\xc1'
converts 'unclosed input' IBM930 IBM939 '\x0e\x44\x81' '\x0e\x44\x81\x0f'
converts 'input of a Shift-Out' IBM930 IBM939 '\xc1\x0e' '\xc1'
converts 'meeting fields' IBM930 MS932 '\x0e\x44\x81\x0f\x0e\x44\x81\x0f\xc1\xc1\xc1\xc1\xc1\xc1\xc1\xc1' \
  '\x82\xa0\x82\xa0AAAAAAAA'

# --- Standard input and several files are one text.
bytes 'a\xe3\x81' part1
bytes '\x82b' part2
bytes 'a\x82\xa0b' expected
convert 'file and standard input' 0 '' utf8 ms932 part1 - <part2
same 'file and standard input' out expected
convert 'standard input' 0 '' utf8 ms932 < <(cat part1 part2)
same 'standard input' out expected

# --- Losses: each kind with its place, malformed bytes that take nothing along, and what is none.
# loses NAME FROM TO INPUT OUTPUT MESSAGE: the output is complete, exit 1; --lossy is silent; --strict stops at the first.
loses() {
  bytes "$4" in
  bytes "$5" expected
  convert "$1" 1 "lexicor: $6" "$2" "$3" in
  same "$1" out expected
  sed -n '1s/.* lost \(from .*\):.*/lexicor: stopped at the first loss \1/p;2p' err >first
  convert "$1, lossy" 0 '' "$2" "$3" --lossy -o lossy in
  same "$1, lossy" lossy expected
  rm -f none
  convert "$1, strict" 1 "$(cat first)" "$2" "$3" --strict -o none in
  [ ! -e none ] || fault "$1: --strict left a file"
}
bad='is not UTF-8:'
loses 'kinds of losses' utf8 ms932 'A\xc3\xa9\xf0\x9f\x98\x80\xff\n\xef\xbf\xbd\xc3\x41?\xe3\x80\x9c' 'A???\n??A?\x81\x60' \
  "6 characters lost from UTF-8 to MS932: 2 malformed, 3 not in MS932, 1 changed
  line 1, column 2 (byte 1): U+00E9 is not in MS932
  line 1, column 3 (byte 3): U+1F600 is not in MS932
  line 1, column 4 (byte 7): byte FF $bad no character has it
  line 2, column 1 (byte 9): U+FFFD is not in MS932
  line 2, column 2 (byte 12): byte C3 $bad 80 to BF must follow, but there is 41
  line 2, column 5 (byte 15): U+301C becomes U+FF5E in MS932"
loses 'malformed UTF-8' utf8 utf8 'Fran\xe7ois \xed\xa0\x80\xc0\xaf\xf4\x90\xe2\x82\xf0\x9f\x98\x80\xf0\x9f\x98' \
  'Fran\xef\xbf\xbdois \xef\xbf\xbd\xef\xbf\xbd\xef\xbf\xbd\xef\xbf\xbd\xef\xbf\xbd\xef\xbf\xbd\xef\xbf\xbd\xef\xbf\xbd\xf0\x9f\x98\x80\xef\xbf\xbd' \
  "10 characters lost from UTF-8 to UTF-8: 10 malformed
  line 1, column 5 (byte 4): byte E7 $bad 80 to BF must follow, but there is 6F
  line 1, column 10 (byte 9): byte ED $bad 80 to 9F must follow, but there is A0
  line 1, column 11 (byte 10): byte A0 $bad it continues a character, and none begins before it
  line 1, column 12 (byte 11): byte 80 $bad it continues a character, and none begins before it
  line 1, column 13 (byte 12): byte C0 $bad no character has it
  line 1, column 14 (byte 13): byte AF $bad it continues a character, and none begins before it
  line 1, column 15 (byte 14): byte F4 $bad 80 to 8F must follow, but there is 90
  line 1, column 16 (byte 15): byte 90 $bad it continues a character, and none begins before it
  line 1, column 17 (byte 16): bytes E2 82 are not UTF-8: 80 to BF must follow, but there is F0
  line 1, column 19 (byte 22): bytes F0 9F 98 are not UTF-8: 80 to BF must follow, but the text ends"
loses 'malformed double-byte text' MS932 UTF-8 'a\x81\nb\x81\xad\xfa\x54\x81' 'a\xef\xbf\xbd\nb\xef\xbf\xbd\xef\xbf\xa2\xef\xbf\xbd' \
  '4 characters lost from MS932 to UTF-8: 2 malformed, 1 unassigned in MS932, 1 changed
  line 1, column 2 (byte 1): byte 81 is not MS932: a trail byte must follow, but there is 0A
  line 2, column 2 (byte 4): bytes 81 AD are no character of MS932
  line 2, column 3 (byte 6): bytes FA 54 are U+FFE2, which MS932 writes as 81 CA
  line 2, column 4 (byte 8): byte 81 is not MS932: a trail byte must follow, but the text ends'
state='is not IBM930 in the double-byte state:'
loses 'malformed shift-sensitive text' 930 us-ascii '\xc1\x0e\x44\x81\x44\x0f\xc1\x15\x0e\x15\x44\x82\x44' 'A??A????' \
  "6 characters lost from IBM930 to US-ASCII: 3 malformed, 3 not in US-ASCII
  line 1, column 2 (byte 2): U+3042 is not in US-ASCII
  line 1, column 3 (byte 4): byte 44 $state a second byte must follow, but there is 0F
  line 1, column 5 (byte 7): U+0085 is not in US-ASCII
  line 2, column 1 (byte 9): byte 15 $state no character begins with it
  line 2, column 2 (byte 10): U+3044 is not in US-ASCII
  line 2, column 3 (byte 12): byte 44 $state a second byte must follow, but the text ends"
bytes 'b\xf0\x9f\x98\x80c' in
"$lexicor" convert --from utf8 --to 930 --lossy in >substituted
bytes 'b\x0ec' in
says 'a character that would be a shift byte' 1 'U+000E is not in IBM930' "$lexicor" convert --from utf8 --to 930 in
same 'a character that would be a shift byte' out substituted
{ head -c 65533 /dev/zero | tr '\0' a && printf '\xf0\x9f\x98\x80' && head -c 70000 /dev/zero | tr '\0' a &&
  printf '%.0s\xe2\x82\xac' $(seq 12); } >in
convert 'losses in later pieces' 1 'lexicor: 13 characters lost from UTF-8 to Latin1: 13 not in Latin1
  line 1, column 65534 (byte 65533): U+1F600 is not in Latin1
'"$(for i in $(seq 0 8); do echo "  line 1, column $((135535 + i)) (byte $((135537 + 3 * i))): U+20AC is not in Latin1"; done)"'
  and 3 more' UTF-8 Latin1 in
{ head -c 65535 /dev/zero | tr '\0' a && printf '\xe3\x81\x82\xef\xbf\xbd?\x1a'; } >in
convert 'no loss' 0 '' UTF-8 UTF-8 --strict in
converts 'substitution characters themselves' UTF-8 MS932 '?\x1a\xe3\x81\x82' '?\x1a\x82\xa0'

# --- A signature begins each file that has one; places are those of the file.
bytes 'abc' plain
bytes '\xef\xbb\xbfd\n\xe2\x82\xac\xef\xbb\xbf\xe3\x81' marked
convert 'signatures' 1 'lexicor: 3 characters lost from UTF-8 to Latin1: 1 malformed, 2 not in Latin1
  marked, line 2, column 1 (byte 5): U+20AC is not in Latin1
  marked, line 2, column 2 (byte 8): U+FEFF is not in Latin1
  marked, line 2, column 3 (byte 11): bytes E3 81 are not UTF-8: 80 to BF must follow, but there is 61' UTF-8 Latin1 plain marked plain
cp marked expected && truncate -s 11 expected && cp expected marked
convert 'a signature in UTF-8' 0 '' UTF-8 UTF-8 marked
same 'a signature in UTF-8' out expected

# --- The output file changes only when the conversion is complete, and then keeps its mode and its link.
bytes 'ab\xe3\x81' cut
printf 'old' >old && chmod 640 old && ln -s old link && ln -s new dangling
for arguments in '--from UTF-8 --to MS932 --strict cut' '--from UTF-8 --to Latin1 none'; do
  "$lexicor" convert $arguments -o old 2>err && fault "$arguments: no error"
  [ "$(cat old)" = old ] || fault "$arguments: the output file changed"
done
convert 'output through a link' 0 '' UTF-8 Latin1 -o link plain
[ "$(cat old)" = abc ] && [ -L link ] || fault 'output through a link'
[ "$(stat -c %a old)" = 640 ] || fault 'mode of the output file'
convert 'output through a dangling link' 0 '' UTF-8 Latin1 -o dangling plain
same 'output through a dangling link' new plain
printf 'before ' >log
convert 'an open file' 0 '' UTF-8 Latin1 -o /dev/fd/3 plain 3>>log
same 'an open file' log <(printf 'before abc')
mkfifo pipe && { cat pipe >read & }
convert 'a named pipe' 0 '' UTF-8 Latin1 -o pipe plain
wait $!
same 'a named pipe' read plain
expect 'closed input' 1 'lexicor: standard input: it is closed' "$lexicor" convert --from UTF-8 --to Latin1 <&-
(expect 'no open descriptor' 0 '' sh -c '"$0" convert --from UTF-8 --to Latin1 -o unsaid plain <&- >&- 2>&-' "$lexicor")
same 'no open descriptor' unsaid plain
convert 'a file onto itself' 0 '' UTF-8 037 -o old old
same 'a file onto itself' old <(printf '\x81\x82\x83')
ls old.* link.* none* >/dev/null 2>&1 && fault 'a temporary file is left'

# --- Errors: data and files 1, command lines 2.
says 'near names' 2 "unknown codepage 'MS93'; did you mean MS932, .* or .*?" "$lexicor" convert --from MS93 --to utf8
says 'near alias' 2 'did you mean SHIFT-JIS' "$lexicor" convert --from shift+jis --to utf8
says 'no near name' 2 'lexicor list codepages' "$lexicor" convert --from xyzzyplugh --to utf8
says 'identifier that is none' 2 "unknown codepage '70000'" "$lexicor" convert --from 70000 --to utf8
says 'no subcommand' 2 'subcommand is required' "$lexicor"
says 'unknown option' 2 '^lexicor: unknown option --form; did you mean --from?$' "$lexicor" convert --form utf8
says 'unknown command' 2 "^lexicor: unknown command 'sotr'; did you mean sort?$" "$lexicor" sotr --locale German
says 'not yet a codepage' 2 "codepage 'utf-16le' is not supported" "$lexicor" convert --from utf-16le --to utf8
convert 'no input file' 1 'lexicor: none: No such file or directory' utf8 037 none
convert 'a directory' 1 'lexicor: .: Is a directory' utf8 037 .
convert 'no output directory' 1 'lexicor: none/out: No such file or directory' utf8 037 -o none/out plain
for arguments in 'convert --from utf8 --to 037 plain' 'list' '--help' '--version'; do
  "$lexicor" $arguments >/dev/full 2>err && fault "$arguments: a full device is no error"
  [ "$(cat err)" = 'lexicor: standard output: No space left on device' ] || fault "$arguments: $(cat err)"
done
convert 'a full device' 1 'lexicor: /dev/full: No space left on device' utf8 037 -o /dev/full plain
for arguments in 'convert --from utf8 --to 037' 'list aliases'; do
  yes | head -c 1000000 | { "$lexicor" $arguments 2>err; echo $? >status; } | head -c 5 >/dev/null
  [ ! -s err ] || fault "$arguments: a closed pipe says $(cat err)"
  [ -s status ] || fault "$arguments: no status"
done
[ "$("$lexicor" --version)" = 'lexicor 1.0.0' ] || fault 'version'

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
cp -r "$2/locale" damaged && head -c 100 /dev/zero >damaged/so_00001.nls
says 'a damaged default sort' 1 'sort Default cannot be loaded: the file is damaged .*(code 2000): damaged/so_00001.nls' \
  "$lexicor" --locale-dir damaged compare --locale German a b
: >broken/control.nls
says 'an empty control file' 0 'in broken (broken/control.nls is empty)' "$lexicor" --locale-dir broken list
head -c 100 /dev/zero >broken/control.nls
says 'a damaged control file' 0 'in broken (the file is damaged' "$lexicor" --locale-dir broken list
grep -q '^ *1  US-ASCII$' out || fault 'the built-in codepage is not listed'

# --- Mapping: the language's own mappings, the codepage, and text that meets the end of a piece everywhere.
# maps NAME MAPPING INPUT OUTPUT ARGUMENTS...: input and expected output as escapes of printf.
maps() {
  bytes "$3" in
  bytes "$4" expected
  expect "$1" 0 '' "$lexicor" map "$2" "${@:5}" in
  same "$1" out expected
}
maps 'upper case' upper 'stra\xc3\x9fe \xd1\x8f \xf0\x9f\x98\x80' 'STRA\xc3\x9fE \xd0\xaf \xf0\x9f\x98\x80'
maps 'upper case in German' upper 'stra\xc3\x9fe' 'STRASSE' --locale German_Austria.IBM930
maps 'lower case on a host' lower '\xc1\x81' '\x81\x81' --codepage 273
maps 'digits' digits '\xd9\xa3\xef\xbc\x93x' '33x'
maps 'full width' full 'A\xb1' '\x82\x60\x83\x41' --codepage MS932
maps 'half width' half '\x0e\x42\xc1\x42\xc2' '\xc1\xc2\x0e' --codepage IBM930
maps 'meeting fields in capitals' upper '\x0e\x44\x81\x0f\x0e\x42\x81\x0f\x81' '\x0e\x44\x81\x0f\x0e\x42\xc1\x0f\xc1' \
  --codepage IBM939
maps 'meeting fields' half '\x0e\x44\x81\x0f\x0e\x42\xc1\x0f\xc1' '\x0e\x44\x81\x0f\xc1\xc1' --codepage IBM930
for bytes in $(seq 65530 65537); do
  { head -c "$bytes" /dev/zero | tr '\0' a && printf '\xce\x91\xce\xa3 \xce\xa3\xce\x91'; } >in
  { head -c "$bytes" /dev/zero | tr '\0' a && printf '\xce\xb1\xcf\x82 \xcf\x83\xce\xb1'; } >expected
  expect "a pair behind $bytes bytes" 0 '' "$lexicor" map lower --locale Greek in
  same "a pair behind $bytes bytes" out expected
done
for shift in '' x xx; do
  { printf '%s' "$shift" && cat text; } | "$lexicor" convert --from utf8 --to IBM939 >large
  for mapping in half full upper; do
    name="1 MB mapped to $mapping, ${#shift} before it"
    "$lexicor" map "$mapping" "$samples/japanese.txt" >sample
    { printf '%s' "$shift" | "$lexicor" map "$mapping" && yes "$(cat sample)" | head -n "$(wc -l <text)"; } >expected
    "$lexicor" map "$mapping" -o there --codepage IBM939 large
    [ "$mapping" != upper ] || [ "$(stat -c %s there)" = "$(stat -c %s large)" ] || fault "$name: size"
    grep -qaP '[\x0e\x0f]{2}' there && fault "$name: two shift bytes in a row"
    convert "$name" 0 '' IBM939 UTF-8 --strict there
    same "$name" out expected
  done
done
bytes 'bir iki' in
expect 'a letter that the codepage lacks' 1 'lexicor: 3 characters lost: U+0069 maps to U+0130, which is not in MS932' \
  "$lexicor" map upper --locale Turkish --codepage MS932 in
same 'a letter that the codepage lacks' out <(printf 'B?R ?K?')
maps 'malformed text between letters' upper 'a\xc3bc\xe7oi\xc3\xa9\xe3\x81' 'A\xc3BC\xe7OI\xc3\x89\xe3\x81'
maps 'malformed double-byte text' half '\x82\x60\x81\n\x82\x60\x82' 'A\x81\nA\x82' --codepage MS932
maps 'malformed host text' lower '\xc1\x0e\x42\xc1\x44\x0f\xc1\x0e\x25\x42\xc1' '\x81\x0e\x42\x81\x44\x0f\x81\x0e\x25\x42\x81' --codepage IBM939
says 'no such mapping' 2 'title not in' "$lexicor" map title
says 'mapping for an unknown locale' 2 "no territory 'Mars'.*lexicor list territories" "$lexicor" map upper --locale English_Mars

# --- Translation of fields: a size, padding and blanks, UTF-16, what is left over.
# translates NAME STATUS STDERR INPUT OUTPUT ARGUMENTS...: input and expected output as escapes of printf.
translates() {
  bytes "$4" in
  bytes "$5" expected
  expect "$1" "$2" "$3" "$lexicor" translate "${@:6}" in
  same "$1" out expected
}
translates 'a field' 0 '' '\xe3\x81\x82A\n' '\x0e\x44\x81\x0f\xc1\x25' --from UTF-8 --to 930
translates 'from UTF-16' 0 '' '\x42\x30A\0' '\xe3\x81\x82A' --from 1200 --to utf8
translates 'to UTF-16' 0 '' '\xe3\x81\x82A' '\x42\x30A\0 \0' --from utf8 --to utf-16 --pad --size 7
translates 'no bytes' 0 '' '' '' --from 1252 --to 1200
translates 'padded on a host' 0 '' 'ab' '\x81\x82\x40\x40' --from 1252 --to 1141 --size 4 --pad
translates 'trimmed' 0 '' 'ab  ' 'ab' --from 1252 --to 1251 --size 2 --trim
translates 'left over' 1 'lexicor: the input is left over from byte 2 on: it does not fit in a size of 2, or ends inside a character' \
  'ab  ' 'ab' --from 1252 --to 1251 --size 2
translates 'a lost character' 1 'lexicor: 1 character lost from UTF-8 to MS932: 1 not in MS932
  line 1, column 2 (byte 1): U+00E9 is not in MS932' 'a\xc3\xa9' 'a?' --from utf8 --to 932
translates 'a lost character, lossy' 0 '' 'a\xc3\xa9' 'a?' --from utf8 --to 932 --lossy
translates 'half a pair' 1 'lexicor: 1 character lost from UTF-16 to US-ASCII: 1 not in US-ASCII
  byte 2: U+D83D is not in US-ASCII' 'a\0\x3d\xd8' 'a?' --from 1200 --to us-ascii
translates 'units cut' 1 'lexicor: the input ends inside the character that begins at byte 2' 'a\0b' '' --from 1200 --to utf8
translates 'a malformed field' 1 "lexicor: malformed input at line 1, column 2 (byte 1): byte E3 $bad 80 to BF must follow, but the text ends" 'a\xe3' '' \
  --from utf8 --to 1252
translates 'a field beyond 16 bits' 1 "lexicor: line 1, column 2 (byte 1): U+1F600 is beyond U+FFFF, which only 'lexicor convert' takes" \
  'a\xf0\x9f\x98\x80' '' --from utf8 --to utf8
says 'padding to no size' 2 '--pad requires --size' "$lexicor" translate --from 1252 --to 1251 --pad
says 'a size of nothing' 2 '--size' "$lexicor" translate --from 1252 --to 1251 --size 0
says 'translation from an unknown codepage' 2 "unknown codepage 'utf-17'" "$lexicor" translate --from utf-17 --to 1251
"$lexicor" translate --from UTF-8 --to IBM939 text >there
same '1 MB translated' there <("$lexicor" convert --from UTF-8 --to IBM939 text)

# --- Line ends: every kind, kinds left alone, shift states, ends that meet the end of a piece.
# rewrites NAME STDERR FROM EOL INPUT OUTPUT ARGUMENTS...: input and expected output as escapes of printf.
rewrites() {
  bytes "$5" in
  bytes "$6" expected
  expect "$1" 0 "$2" "$lexicor" lines --from "$3" --eol "$4" "${@:7}" in
  same "$1" out expected
}
rewrites 'to line feeds' 'lexicor: 3 line ends (2 crlf, 1 lf), 2 rewritten' utf8 lf 'a\r\n\r\n\xc3\xa9\nb\r' \
  'a\n\n\xc3\xa9\nb\r' --report
rewrites 'to pairs' '' MS932 crlf '\x82\xa0\n\x83\x5c\r\n\n' '\x82\xa0\r\n\x83\x5c\r\n\r\n'
rewrites 'host lines to new line' 'lexicor: 3 line ends (1 crlf, 1 lf, 1 nl), 2 rewritten' IBM939 nl \
  '\x0e\x44\x81\x0f\x0d\x25\xc1\x15\x25' '\x0e\x44\x81\x0f\x15\xc1\x15\x15' --report
rewrites 'characters beyond U+FFFF' '' utf8 lf '\xf0\x9f\x98\x80\r\n' '\xf0\x9f\x98\x80\n'
rewrites 'an unclosed text' '' IBM939 lf '\x15\x0e\x44\x81' '\x25\x0e\x44\x81\x0f'
rewrites 'only pairs' '' IBM037 lf '\x25\x0d\x25\x15' '\x25\x25\x15' --find crlf
rewrites 'an empty text' 'lexicor: 0 line ends, 0 rewritten' utf8 lf '' '' --report
for bytes in 4094 4095 4096 65534 65535 65536; do
  { head -c "$bytes" /dev/zero | tr '\0' a && printf '\r\n\xe3\x81\x82\r\n'; } >in
  "$lexicor" lines --from utf8 --eol lf -o out in
  same "a pair behind $bytes bytes" out <(tr -d '\r' <in)
done
bytes 'a\r\n\xe7\x81\n' half
expect 'malformed lines' 1 "lexicor: malformed input at line 2, column 1 (byte 3): bytes E7 81 are not UTF-8: 80 to BF must follow, but there is 0A" \
  "$lexicor" lines --from utf8 --eol lf -o old half
same 'the output of malformed lines' old <(printf '\x81\x82\x83')
says 'no such line end' 2 'cr not in' "$lexicor" lines --from utf8 --eol cr
says 'a full device' 1 '/dev/full' "$lexicor" lines --from utf8 --eol lf -o /dev/full plain
says 'a missing text' 1 'lexicor: missing: ' "$lexicor" lines --from utf8 --eol lf missing

# --- Sorting: line ends, the sort, keys beside comparison, and what a line may hold.
# sorts NAME INPUT OUTPUT ARGUMENTS...: input and expected output as escapes of printf.
sorts() {
  bytes "$2" in
  bytes "$3" expected
  expect "$1" 0 '' "$lexicor" sort "${@:4}" in
  same "$1" out expected
}
for key in '' --key; do
  sorts "the alphabet's end $key" 'zebra\n\xc3\xb6l\n\xc3\x84pple\napa\n' 'apa\nzebra\n\xc3\x84pple\n\xc3\xb6l\n' \
    --locale Swedish@Swedish $key
  sorts "a line without an end $key" 'b\r\nx\0y\nx\0\r\n\n\r\na' '\n\r\na\r\nb\r\nx\0\r\nx\0y\n' --locale English@BINARY $key
  sorts "equal lines $key" 'b\na\nA\r\nB\na\r\n' 'b\nB\na\nA\r\na\r\n' --locale English@Default --case-insensitive --reverse $key
  sorts "unequal lines $key" 'b\nA\na\r\nB\na\n' 'A\nb\n' --locale English@Default --case-insensitive --unique=order $key
  sorts "lines of other bytes $key" 'a\nco\xc2\xadop\ncoop\nco\xc2\xadop\na\r\nb\ncoop' 'a\na\r\nb\nco\xc2\xadop\ncoop\n' \
    --locale English@Default --unique $key
  sorts "without case in binary order $key" '\xb1\n\x88\x9f\na\n\nA\n\0\0\0\n' '\n\0\0\0\na\nA\n\xb1\n\x88\x9f\n' \
    --locale English@BINARY --codepage MS932 --case-insensitive $key
  sorts "host text with meeting fields $key" '\x0e\x44\x82\x0f\x0e\x44\x81\x0f\x25\xc1\x25\x0e\x44\x82\x44\x81\x0f\x25\x0e\x44\x81' \
    '\xc1\x25\x0e\x44\x81\x0f\x25\x0e\x44\x82\x0f\x0e\x44\x81\x0f\x25' \
    --locale Japanese@Japanese --codepage IBM930 --unique=order $key
done
bytes 'b\na' part1
bytes 'd\nc\n' part2
expect 'each file ends its last line' 0 '' "$lexicor" sort -o part2 part2 part1
same 'each file ends its last line' part2 <(printf 'a\nb\nc\nd\n')
python3 -c '
import random
random.seed(1)
for _ in range(100000):
    print("".join(random.choices("aàbcdhlnñoôszAÀCHÑ \u0301\u00ad-中ガ", k=random.randrange(9))))' >words
for locale in English@Default Spanish@SpanishTraditional French@FrenchCanadian Vietnamese@Vietnamese; do
  expect "100,000 lines in $locale" 0 '' "$lexicor" sort --locale $locale -o compared words
  expect "100,000 keys in $locale" 0 '' "$lexicor" sort --locale $locale --key -o by_key words
  same "keys and comparison in $locale" by_key compared
  same "the lines in $locale" <(sort compared) <(sort words)
done
"$lexicor" sort --locale English@BINARY words >out
same 'binary order' out <(sort words)
bytes 'a\nb\xe3\x81\nc' in
expect 'a line that ends in a character' 1 'lexicor: a line ends inside the character that begins at byte 3' "$lexicor" sort in
expect 'sorted input cut' 1 'lexicor: the input ends inside the character that begins at byte 2' "$lexicor" sort -o old cut
same 'the output of a cut sort' old <(printf '\x81\x82\x83')
if script --version >/dev/null 2>&1; then
  for _ in 1 2 3; do cat words; done >many
  script -qec "'$lexicor' sort --locale English@Default --key -o out many" /dev/null | grep -q ' 100 %' ||
    fault 'no bar on a terminal'
fi

# --- Which text comes first, and why.
# orders EXIT OUTPUT SUBCOMMAND ARGUMENTS...: the exit status and the whole, or for explain the last line, of the output.
orders() {
  expect "$*" "$1" '' "$lexicor" "${@:3}"
  [ "$(tail -n 1 out)" = "$2" ] || fault "$*: $(cat out)"
}
orders 4 'ö > z' compare --locale sv_SE.UTF-8 ö z
expect "the user's order" 4 '' env LC_ALL=sv_SE.UTF-8 "$lexicor" compare ö z
says "the user's unknown system locale" 3 '^lexicor: .* xx_YY.UTF-8: it is not known; English_UnitedStates\..* is used instead$' \
  env LC_ALL=xx_YY.UTF-8 "$lexicor" compare ö z
orders 3 'ö < z' compare --locale German@Default ö z
orders 0 'Zoo = zoo' compare --locale English@Default --case-insensitive Zoo zoo
orders 0 'Ａ = A' compare --locale Japanese@Japanese --width-insensitive Ａ A
orders 3 'Ａb < abc' compare --locale Japanese@BINARY --width-insensitive Ａb abc
orders 3 'ab < abc' compare --locale English@Default --width-insensitive ab abc
orders 0 $'\xc2\xad- = -: nothing decides' explain --locale English@Default $'\xc2\xad-' -
expect 'half an argument' 1 "lexicor: 'a"$'\xe3'"' ends inside the character that begins at byte 1" "$lexicor" compare a$'\xe3' b
says 'case and width' 2 'excludes' "$lexicor" compare --width-insensitive --case-insensitive a b
orders 0 '61 C3 A9' key --locale English@BINARY aé
orders 0 '[ | | |]' key --locale English@Default ''
orders 0 "$("$lexicor" key --locale English@Default ae | sed 's/\]/ 0002:0014]/')" key --locale English@Default a-e
"$lexicor" key --locale English@Default -- -- | grep -qE '^\[ \| \| \|( [0-9A-F]{4}){2}\]$' || fault 'a key of special weights'
orders 0 'côte < coté: decided by the secondary weights' explain --locale French@FrenchCanadian côte coté
grep -q 'inserted: secondary  ô$' out && grep -q '^secondary: decides: number 1 is ' out || fault "explain: $(cat out)"
orders 0 'côte > coté: decided by the secondary weights' explain --locale French@Default côte coté
orders 0 'chata > cihla: decided by the primary weights' explain --locale Czech@Czech chata cihla
grep -q '^  U+0063 U+0068  .*  ch$' out || fault "a pair explained: $(cat out)"
orders 0 'co-op > coop: decided by the special weights' explain --locale English@Default co-op coop
grep -q '^special: decides: number 1 is 0003:.* in A, none in B$' out || fault "special weights explained: $(cat out)"
orders 0 'æ = æ: nothing decides' explain --locale English@Default æ æ
grep -q '^    and  ' out || fault "an expansion explained: $(cat out)"
orders 0 '😀 > é: decided by the bytes' explain --locale English@BINARY 😀 é
grep -q '^  U+FFFD  F0     byte F0$' out || fault "bytes explained: $(cat out)"

# --- Locales: their items, and the operating system's names.
"$lexicor" info English_UnitedStates.IBM930 >out || fault 'info'
[ "$(awk '{print $1}' out)" = "$(seq 88)" ] || fault 'info: the 88 items'
for line in ' 9  codepage_id *930' '22  day_7 *"Saturday"' '42  month_13 *""' '59  decimal *"\."' '87  codepage_shift *1'; do
  grep -q "^$line\$" out || fault "info: $line"
done
expect 'info on the user' 0 '' "$lexicor" info
grep -q '"English_UnitedStates.US-ASCII@Binary"$' out || fault 'info on the user'
says "the user's unknown locale" 0 "no territory 'X'" env LX_LANG=English_X "$lexicor" info
"$lexicor" info --native C --json | python3 -c '
import json, sys
items = json.load(sys.stdin)["items"]
assert [row["item"] for row in items] == list(range(1, 89))
assert items[63]["name"] == "currency" and items[0] == {"item": 1, "name": "language_id", "value": 1}, items
' || fault 'info as JSON'
cp "$2/locale/control.nls" broken
says 'info on no locale' 2 "no language 'Klingon'" "$lexicor" info Klingon
says 'info on a damaged codepage' 1 'codepage IBM037 cannot be loaded' "$lexicor" --locale-dir broken info English.IBM037
says 'an unknown system name' 2 "operating-system locale 'c'" "$lexicor" info --native c
expect 'a whole system locale' 0 '' "$lexicor" native 'LC_CTYPE=ja_JP.EUC-JP;LC_NUMERIC=C;LC_TIME=C;LC_COLLATE=C;'
grep -q '^codepage   JapanEUC ' out || fault "a whole system locale: $(cat out)"
expect 'an unknown system locale' 1 \
  "lexicor: unknown operating-system locale 'xx'; 'lexicor list locales' shows those that are known" "$lexicor" native xx
run 'a system locale with missing objects' 1 "$lexicor" --locale-dir broken native en_US.utf8
grep -q '^language   English  *there$' out && grep -q '^codepage   UTF-8  *missing: file not found$' out ||
  fault "a system locale with missing objects: $(cat out)"

# --- Numbers, money and times: written, read back, and where reading stops.
# answers OUTPUT ARGUMENTS...: exit status 0 and the whole of the output.
answers() {
  expect "${*:2}" 0 '' "$lexicor" "${@:2}"
  [ "$(cat out)" = "$1" ] || fault "${*:2}: $(cat out)"
}
# stops STATUS AT MESSAGE TEXT ARGUMENTS...: the exit status, the message, and a mark below column AT of the text.
stops() {
  expect "${*:5}" "$1" "$(printf 'lexicor: %s\n  %s\n  %*s^' "$3" "$4" "$2" '')" "$lexicor" "${@:5}"
}
answers '-1.234.567' format number -1234567 --locale German.IBM273
answers '-2,14,74,83,649' format number -2147483649 --locale Hindi_India
answers '5,000,000,000.23' format number 5000000000.239 --locale English
answers '-₹12,34,567.50' format money -1234567.5 --locale Hindi_India
answers 'JPY1,234.' format money 1234 --locale Japanese_Japan --international
answers 'Samstag, 21.11.26; 14:05:09 %' format time 2026-11-21T14:05:09 --locale German_Germany --format '%A, %x; %X %%'
answers '2/29/00 12:00:00 AM' format time 2000-02-29
answers 'Wednesday 365' format time 2008-12-31 --format '%A %j'
answers 34 parse number ٣٤
answers -1234.5 parse money -- '-$1,234.50'
answers 1234.5 parse money '1,234.50 USD'
answers -5 parse money '($5)'
answers 2026-11-21 parse time '21. November 2026' --locale German --format '%d. %B %Y'
answers 12:05:00 parse time '12:05 PM' --format '%I:%M %p'
answers 1926-11-21T14:05:09 parse time '21.11.26 14:05:09' --locale German_Germany
for locale in French_France Swedish German_German-Switzerland Thai Arabic English_UnitedStates Greek; do
  for value in 'number -1234567.89' 'money -1234567.89' 'money 7' 'time 2026-03-04T00:05:09 --format %c%%%#c'; do
    read -r kind number format <<<"$value"
    text=$("$lexicor" format $kind --locale $locale $format -- "$number")
    answers "$number" parse $kind --locale $locale $format -- "$text"
  done
done
number='reading stopped: not a number as the locale writes it'
amount='reading stopped: not an amount as the locale writes it'
stops 1 3 "$number" 1,2x4 parse number 1,2x4
stops 1 1 "$number" - parse number -- -
stops 1 1 "$number" '1 234' parse number '1 234' --locale English
stops 1 3 "$amount" '$12$4' parse money '$12$4'
stops 1 1 "$amount" '--5' parse money -- --5
stops 1 4 'reading stopped: not a time in the format 日本%d' 日本x parse time 日本x --format 日本%d
stops 1 4 'reading stopped: not a time in the format %d. %B %Y' '21. Novembr 2026' parse time '21. Novembr 2026' --format '%d. %B %Y'
stops 1 10 'the month has no such day' 31.02.2026 parse time 31.02.2026 --format %d.%m.%Y
stops 1 3 'the text has a date without a year' Nov parse time Nov --format %b
stops 2 1 'a format has no such directive' é%U parse time 5 --format é%U
stops 1 8 'there is no such time' 2026-02-29 format time 2026-02-29
stops 1 6 'a time has the form YYYY-MM-DD[THH:MM[:SS]]' 2026-1-1 format time 2026-1-1
stops 1 1 'reading stopped: not a number like -1234.56' 1,5 format money 1,5
stops 1 0 'a whole number that a double cannot hold to its last digit' 9007199254740993 format number 9007199254740993
stops 1 1 'a character that is not UTF-8, or beyond U+FFFF' a😀x parse number a😀x
stops 1 1 'a character that is not UTF-8, or beyond U+FFFF' a$'\xc3'bc parse number a$'\xc3'bc
expect 'a format of a number' 2 'lexicor: --format is for times' "$lexicor" format number 1 --format %x

# --- Messages: a catalog of one, in Latin1, written by hand for a little-endian machine.
words() { for word; do printf "$(printf '\\x%02x' $((word & 255)) $((word >> 8 & 255)) $((word >> 16 & 255)) $((word >> 24)))"; done; }
mkdir -p cats/DE_DEU
{ words 0x476cf463 0x10000000 2 1 152 && printf '%s' German.Latin1 && head -c 119 /dev/zero
  words 1 0 1 180 192 6 0 3 6 0 && printf 'Gr\xfc\xdfe\0'; } >cats/DE_DEU/app.cat
answers Grüße message cats/DE_DEU/app.cat 1 3
answers Grüße message app 1 3 --load --locale German_Germany --directory 'none;cats/%L/%N.cat'
answers ersatz message cats/DE_DEU/app.cat 1 4 --default ersatz
"$lexicor" message app 1 3 --locale German_Germany --directory 'cats/%L/%N.cat' --codepage IBM273 >out
same 'a message for a host' out <(printf '\xc7\x99\xd0\xa1\x85\x25')
"$lexicor" message cats/DE_DEU/app.cat 1 4 --codepage IBM930 --default あ >out
same 'a default text for a host' out <(printf '\x0e\x44\x81\x0f\x25')
expect 'no message' 1 "lexicor: the catalog 'cats/DE_DEU/app.cat' has no message 4 in set 1" \
  "$lexicor" message cats/DE_DEU/app.cat 1 4
says 'a directory as catalog' 1 '^cats is a directory: a template names a file, as cats/%N does' \
  "$lexicor" message app 1 3 --directory cats --default ersatz
expect 'no catalog' 1 "lexicor: no catalog 'app' found; searched:
  LX_NLSPATH is not used: it has 28 bytes, and 27 are the most
  name: app
  with %N = app, %l = DE, %t = AUT" \
  env LX_NLSPATH='cats/%L/%N.cat;cats/%l/%N.ca' "$lexicor" message app 1 3 --locale German_Austria --one-locale

# --- Lists.
"$lexicor" list >out || fault 'list'
[ "$(grep -c '^[a-z]' out)" = 4 ] || fault 'the tables of the whole list'
for line in 'codepages 930  IBM930  .*IBM-930.*' 'languages 1  English' 'territories 840  UnitedStates' \
  'sorts 0  BINARY' 'aliases CP932 *MS932' 'locales no_NO  *Norwegian_Norway.Latin1@Danish'; do
  "$lexicor" list "${line%% *}" | grep -q "^ *${line#* }\$" || fault "list: $line"
done
"$lexicor" list --json | python3 -c '
import json, sys
lists = json.load(sys.stdin)
assert list(lists) == ["codepages", "languages", "territories", "sorts"], list(lists)
ms932 = [row for row in lists["codepages"] if row["name"] == "MS932"]
assert len(ms932) == 1 and ms932[0]["id"] == 932 and "CP932" in ms932[0]["aliases"], ms932
' || fault 'the list as JSON'

# --- The README's commands do as they are written, in the source directory; compare answers by its exit code.
while read -r command; do
  command=${command// \/tmp\// $work/}
  (cd "$source_dir" && eval "${command/#build\/m64/$2}") >out 2>err
  status=$?
  [ "$status" = 0 ] || [[ $command == *' compare '* && $status -ge 3 ]] || fault "README: $command: $(cat err)"
done < <(grep '^build/m64/bin/' "$source_dir/README.md")

[ "$failures" = 0 ] || exit 1
echo 'The command line does what it says.'
