#!/usr/bin/env bash
# The virtual card in front of a wrapper that starts the program, for each wrapper that is installed. Catches:
# a card that removes itself from LD_PRELOAD before the program that opens the nodes has loaded it.
. "$(dirname "$0")/common.sh"

export ZARVO_VIRTUAL_CARD=speed=0.1 # slow enough for valgrind
# shellcheck disable=SC2016 # the script expands it
printf '#!/bin/sh\n"$@"\n' >"$FOLDER/script"
chmod +x "$FOLDER/script"
for wrapper in nice 'timeout 60' 'env A=B' 'stdbuf -oL' "bash -c '\"\$@\"' -" "$FOLDER/script" \
  "strace -f -o $FOLDER/calls" 'gdb --batch -nx -ex run --args' 'valgrind -q --tool=none'; do
  words=()
  eval "words+=($wrapper)"
  command -v "${words[0]}" >/dev/null || continue
  "${ON_CARD[@]}" "${words[@]}" "$ZARVO_RECORD" --seconds 2 --channels 1 --force --output "$FOLDER/out" >"$FOLDER/log" 2>&1 || true
  expect "nothing is recorded with '$wrapper': $(tail -5 "$FOLDER/log")" test -s "$FOLDER/out/ch01.m4v"
  rm "$FOLDER/out/ch01.m4v"
done
