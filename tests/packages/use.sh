# In a fresh system, with the packages beside this file: installs them, uses each, removes them.
set -euo pipefail
cd /packages
fail() { echo "packages: $*" >&2; exit 1; }
# says WHAT TEXT COMMAND...: the command writes the text.
says() { local said && said=$("${@:3}") && [ "$said" = "$2" ] || fail "$1: $said"; }
install() { apt-get install -y -qq --no-install-recommends "$@" >install.log 2>&1 || { cat install.log; fail "install $*"; }; }

apt-get update -qq
find / -xdev -iname '*lexicor*' ! -path '/packages/*' | sort >before
install gcc libc6-dev gcc-multilib pkgconf sqlite3
install ./*.deb

# The programs and the data.
lexicor-data check /usr/share/lexicor/locale
says lexicor 'C7996AA185' bash -c 'printf Größe | lexicor convert --from UTF-8 --to IBM273 | od -An -tx1 | tr -d " \n" | tr a-f A-F'
lexicor-gencat --locale German_Germany.IBM273 --from UTF-8 app.cat german.msg
says catalog 'Das Archiv ist vollständig.' lexicor message ./app.cat 1 2
says completion IBM930 bash -c '. /usr/share/bash-completion/completions/lexicor
  COMP_LINE="lexicor chart IBM93" COMP_POINT=19; _lexicor; echo "$COMPREPLY"'
for page in man1/lexicor.1 man5/lexicor-locale.5 man7/lexicor.7 man3/lx_convert.h.3; do
  gzip -t /usr/share/man/$page.gz
done
[ -s /usr/share/doc/lexicor-doc/html/index.html ] && [ -s /usr/share/doc/lexicor-doc/docs/limits.md ] || fail 'no documentation'

# The library in both word sizes, by the examples of the documentation.
printf '$set 1\n1 Disk full\n' | lexicor-gencat app.cat --new
for bits in 64 32; do
  pc=/usr/lib/x86_64-linux-gnu/pkgconfig
  [ $bits = 64 ] || pc=/usr/lib32/pkgconfig
  LX_LOCALEDIR=$(PKG_CONFIG_PATH=$pc pkg-config --variable=localedir lexicor || true)
  export LX_LOCALEDIR=${LX_LOCALEDIR:-/usr/share/lexicor/locale}
  export NLS1_LOCALEDIR=$LX_LOCALEDIR
  for example in /usr/share/doc/lexicor-doc/examples/c/*; do
    # shellcheck disable=SC2046
    gcc -m$bits -std=c99 "$example" $(PKG_CONFIG_PATH=$pc pkg-config --cflags --libs lexicor) -o example
    says "$example in $bits bits" "$(sed '1,/^\/\* Prints:$/d; /^\*\/$/d' "$example")" ./example
  done
done
unset LX_LOCALEDIR NLS1_LOCALEDIR

says python 1.234,50 python3 -c 'import lexicor; print(lexicor.Locale("German").format_number(1234.5))'
says 'codec of Python' GROß env PYTHONIOENCODING=utf-8 python3 -c 'import lexicor; print(b"\xc7\xd9\xd6\xa1".decode("lexicor-ibm273"))'
says SQLite STRASSE sqlite3 :memory: ".load /usr/lib/x86_64-linux-gnu/sqlite3/lexicor" "SELECT lexicor_upper('straße', 'German')"

# What came goes.
# shellcheck disable=SC2046
apt-get purge -y -qq $(for package in *.deb; do dpkg-deb -f "$package" Package; done) >purge.log 2>&1 || { cat purge.log; fail purge; }
find / -xdev -iname '*lexicor*' ! -path '/packages/*' | sort | diff before - || fail 'something stays behind'
