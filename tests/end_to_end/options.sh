#!/usr/bin/env bash
# Every program has --help, -h and --version, and names the possible options when one is wrong. Catches: a
# program that does its work instead, opens the card or a display, or makes folders.
. "$(dirname "$0")/common.sh"

export HOME=$FOLDER/home DISPLAY='' QT_QPA_PLATFORM=offscreen ZARVO_VIRTUAL_CARD=absent
mkdir "$HOME"
cd "$HOME" || exit

# run STATUS PROGRAM ARGUMENT...: that status; output in stdout and stderr.
run() {
  local expected=$1 status=0
  "${@:2}" >"$FOLDER/stdout" 2>"$FOLDER/stderr" || status=$?
  expect_equal "status of ${*:2} ($(cat "$FOLDER/stderr"))" "$expected" "$status"
}

mapfile -t programs < <(find "$ZARVO_BUILD"/{examples,programs,app,packaging} -maxdepth 2 -type f -executable \
  ! -name '*.so*' ! -path '*/CMakeFiles/*')
expect "only ${#programs[@]} programs: ${programs[*]}" test "${#programs[@]}" -ge 6
for program in "${programs[@]}"; do
  name=${program##*/}
  for option in --help -h; do
    run 0 "$program" "$option"
    expect "$name $option does not say how to use it" grep -q "^Usage: $name" "$FOLDER/stdout"
  done
  run 0 "$program" --version
  expect "version of $name: $(cat "$FOLDER/stdout")" grep -qE "^$name [0-9]+\.[0-9]+\.[0-9]+$" "$FOLDER/stdout"
  for arguments in '--wrong' '-w' '--wrong one two'; do
    # shellcheck disable=SC2086 # words
    run 2 "$program" $arguments
    expect "$name $arguments does not name the options: $(cat "$FOLDER/stderr")" \
      grep -q -- --version "$FOLDER/stderr"
  done
done
if [ -n "$PROGRAM" ]; then
  QT_QPA_PLATFORM=xcb run 1 "$PROGRAM"
  expect_equal "lines without a display: $(cat "$FOLDER/stderr")" 1 "$(wc -l <"$FOLDER/stderr")"
fi
expect_equal "what the programs have made" '' "$(ls -A)"
