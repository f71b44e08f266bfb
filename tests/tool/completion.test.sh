#!/usr/bin/env bash
# The bash completion offers the program's real commands and options:
#   completion.test.sh COMPLETION_SCRIPT VENLOMER
# Each command offered must run its own --help; "pins" must offer its three commands; a
# command's options must be those its help lists, and a value option completes file names.
set -uo pipefail
completion=$1 venlomer=$2
# shellcheck source=/dev/null
source "$completion"
failed=0
fail() { echo "FAIL: $*"; failed=1; }

# Completes the words as typed (the last word is the one being completed).
offer() {
    COMP_WORDS=("$venlomer" "$@")
    COMP_CWORD=$#
    COMPREPLY=()
    _venlomer
    printf '%s\n' "${COMPREPLY[@]}" | sort
}

commands=$(offer "")
for expected in floorplan colors pins edit project-files ngd-sample; do
    grep -qx "$expected" <<<"$commands" || fail "no $expected among: $commands"
done
for command in $commands; do
    [[ $command == -* || $command == pins ]] && continue
    "$venlomer" "$command" --help >/dev/null 2>&1 || fail "offered $command, which is no command"
done
[[ $(offer --verbose fl) == floorplan ]] || fail "--verbose before the command hides the commands"
[[ $(offer pins "" | tr '\n' ' ') == "assign check export from-board import show " ]] ||
    fail "pins offers: $(offer pins "")"

floorplan_options=$(offer floorplan --)
for expected in --chipdb --device --package --find --flags --svg --help; do
    grep -qx -- "$expected" <<<"$floorplan_options" || fail "floorplan lacks $expected"
done
for option in $floorplan_options; do
    "$venlomer" floorplan --help | grep -q -- "^  $option\b" || fail "floorplan offers $option"
done
[[ $(offer pins assign --au) == --auto ]] || fail "pins assign --au offers: $(offer pins assign --au)"

scratch=$(mktemp -d) && trap 'rm -rf "$scratch"' EXIT
touch "$scratch/top.pcf"
[[ $(offer pins check --pcf "$scratch/to") == "$scratch/top.pcf" ]] ||
    fail "--pcf does not complete a file name"
exit $failed
