# Sourced by the shell tests: checks that print what they got and what they expected, and count
# the failures in $failures.
failures=0
fail() { printf 'FAILED: %s\n' "$*" >&2; failures=$((failures + 1)); }
# check NAME EXPECTED COMMAND...: the command's output against EXPECTED.
check() {
  local name=$1 want=$2 got
  shift 2
  got=$("$@")
  [ "$got" = "$want" ] || fail "$name"$'\n'"  got:      $got"$'\n'"  expected: $want"
}
# checks: one check a line of standard input, "NAME|EXPECTED|COMMAND"; EXPECTED and COMMAND are
# expanded as shell words where checks is called, so a table can name the caller's variables. The
# commands get no standard input.
checks() {
  local name want command
  while IFS='|' read -r name want command; do eval "check \"\$name\" \"$want\" $command" </dev/null; done
}
