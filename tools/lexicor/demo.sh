#!/bin/bash
# The demo: converts each sample to the codepages that its language lives in, and back, and compares byte for
# byte; then writes the same values as fifteen locales do, and fetches messages of four languages in the codepages
# of their callers. Argument: the build directory. Exit 1 when any text comes back different.
set -u
here=$(cd "$(dirname "${BASH_SOURCE[0]}")" && pwd)
build=${1:?usage: demo.sh BUILD_DIR}
lexicor=$build/bin/lexicor
gencat=$build/bin/lexicor-gencat
samples=$here/../../data/samples
work=$(mktemp -d) || exit 1
trap 'rm -rf "$work"' EXIT
# Text is cut and padded by what it takes on the screen: wide characters two columns, combining ones none.
export LC_ALL=C.UTF-8

good= bad= plain=
if [ -t 1 ] && [ -z "${NO_COLOR:-}" ]; then
  good=$'\033[32m' bad=$'\033[1;31m' plain=$'\033[0m'
fi

columns() { printf '%s\n' "$1" | wc -L; }

# fit TEXT WIDTH: as much of the text as fits, padded.
fit() {
  local text=${1:0:$((2 * $2))} width
  width=$(columns "$text")
  while [ "$width" -gt "$2" ]; do
    # Half of what is too much is safe to take off at once: no character takes more than two columns.
    text=${text:0:$((${#text} - (width - $2 + 1) / 2))}
    width=$(columns "$text")
  done
  printf '%s%*s' "$text" $(($2 - width)) ''
}

# first_bytes FILE: eight of them, in hexadecimal.
first_bytes() { head -c 8 "$1" | od -An -tx1 | tr -d '\n' | tr a-f A-F; }

total=0 failed=0
# trip LANGUAGE SAMPLE CODEPAGE...: one line for each codepage.
trip() {
  local language=$1 sample=$samples/$2 codepage there=$work/there back=$work/back hex text verdict
  shift 2
  for codepage in "$@"; do
    total=$((total + 1))
    rm -f "$there" "$back"
    if "$lexicor" convert --from UTF-8 --to "$codepage" --strict -o "$there" "$sample" &&
      "$lexicor" convert --from "$codepage" --to UTF-8 --strict -o "$back" "$there" &&
      cmp -s "$sample" "$back"; then
      verdict=${good}OK$plain
    else
      failed=$((failed + 1))
      verdict=${bad}DIFFERENT$plain
    fi
    touch "$there" "$back"
    hex=$(first_bytes "$there")
    IFS= read -r text <"$back" || true
    printf '%-20s  %-10s  %4d >%4d  %-24s  %s  %s\n' "$language" "$codepage" \
      "$(stat -c %s "$sample")" "$(stat -c %s "$there")" "$hex" "$(fit "$text" 25)" "$verdict"
  done
}

printf '%-20s  %-10s  %-10s   %-23s  %s\n' 'Text' 'Codepage' 'UTF-8 > CP' 'First bytes' 'Read back'
trip 'Japanese' japanese.txt MS932 JapanEUC IBM930 IBM939
trip 'Chinese, simplified' chinese-simplified.txt MS936 IBM935
trip 'Chinese, traditional' chinese-traditional.txt MS950 EUC-TW IBM937
trip 'Korean' korean.txt MS949 IBM933
trip 'Greek' greek.txt ISO-8859-7
trip 'Russian' russian.txt MS1251 KOI8-R IBM1025
trip 'Hebrew' hebrew.txt ISO-8859-8 MS1255
trip 'Thai' thai.txt MS874
trip 'Czech' czech.txt ISO-8859-2 IBM870
trip 'German' german.txt IBM273 IBM1141
trip 'English' english.txt IBM037 IBM500 IBM1047

if [ "$failed" -gt 0 ]; then
  echo "$bad$failed of $total conversions came back different.$plain"
  exit 1
fi
echo "All $total conversions came back byte for byte."

printf '\nA text that is half Latin1 and half UTF-8, as 932: what cannot come along is said.\n'
if printf 'Fran\xe7ois Müller\nzahlt 5 € 😀\n' | "$lexicor" convert --from UTF-8 --to MS932 2>"$work/said"; then
  echo 'nothing was said' && exit 1
fi
cat "$work/said"

# values LOCALE: the same number, amount and moment as the locale writes them.
values() {
  local number amount moment
  number=$("$lexicor" format number 1234567.89 --locale "$1") &&
    amount=$("$lexicor" format money -1234567.89 --locale "$1") &&
    moment=$("$lexicor" format time 2026-11-21T14:05:09 --format '%#x, %X' --locale "$1") || exit 1
  printf '%-25s  %s  %s  %s\n' "$1" "$(fit "$number" 12)" "$(fit "$amount" 19)" "$moment"
}

printf '\n%-25s  %-12s  %-19s  %s\n' 'Locale' 'Number' 'Amount' 'Moment'
for locale in English_UnitedStates English_India German_Germany German_German-Switzerland French_France \
  Portuguese_Brazil Swedish_Sweden Polish_Poland Greek_Greece Russian_Russia Hindi_India Thai_Thailand \
  Japanese_Japan Korean_Korea Arabic_SaudiArabia; do
  values "$locale"
done

# messages LANGUAGE SOURCE CATALOG_LOCALE SET NUMBER CODEPAGE...: compiles the catalog, and fetches a message of it in
# the codepage of each caller.
messages() {
  local language=$1 catalog=$work/$2.cat locale=$3 set=$4 number=$5 source=$samples/catalog/$2.msg caller text
  shift 5
  "$gencat" --new --locale "$locale" "$catalog" "$source" || exit 1
  for caller in "$@"; do
    "$lexicor" message "$catalog" "$set" "$number" --locale "${locale%.*}" --codepage "$caller" >"$work/message" &&
      "$lexicor" convert --from "$caller" --to UTF-8 --strict -o "$work/shown" "$work/message" || exit 1
    IFS= read -r text <"$work/shown" || true
    printf '%-9s  %-8s  %-8s  %-24s  %s\n' "$language" "${locale#*.}" "$caller" "$(first_bytes "$work/message")" "$text"
  done
}

printf '\n%-9s  %-8s  %-8s   %-23s  %s\n' 'Messages' 'Catalog' 'Caller' 'First bytes' 'Text'
messages English english English_UnitedStates.IBM037 1 2 MS1252 IBM500
messages German german German_Germany.IBM273 1 2 MS1252 IBM850 IBM1141
messages Japanese japanese Japanese_Japan.IBM930 1 2 MS932 JapanEUC IBM939
messages Russian russian Russian_Russia.MS1251 1 2 KOI8-R IBM866 IBM1025
