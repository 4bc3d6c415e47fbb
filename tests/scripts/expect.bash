# What the tests of the command-line programs share, to be sourced: an empty directory to work in, and the checks of a
# program's exit status, its output and what it says.
work=$(mktemp -d) || exit 1
trap 'rm -rf "$work"' EXIT
cd "$work" || exit 1

failures=0
fault() { echo "FAILED: $1" && failures=$((failures + 1)); }

# run NAME STATUS COMMAND...: the exit status. Output goes to out, standard error to err.
run() {
  "${@:3}" >out 2>err
  local actual=$?
  [ "$actual" = "$2" ] || fault "$1: exit $actual, expected $2"
}
# expect NAME STATUS STDERR COMMAND...: the exit status, and the whole of standard error.
expect() {
  run "$1" "$2" "${@:4}"
  [ "$(cat err)" = "$3" ] || fault "$1: standard error is: $(cat err)"
}
# says NAME STATUS PATTERN COMMAND...: the exit status, and a pattern in standard error.
says() {
  run "$1" "$2" "${@:4}"
  grep -q -e "$3" err || fault "$1: standard error is: $(cat err)"
}
same() { cmp "$2" "$3" >&2 || fault "$1"; }
# bytes TEXT FILE: a file of the bytes that the escapes of printf stand for.
bytes() { printf "$1" >"$2"; }
