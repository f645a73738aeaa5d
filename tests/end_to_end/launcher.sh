#!/usr/bin/env bash
# The launcher of the installed program: which card it says and uses, its log, and that the reason of an error can
# be read. A stand-in takes the place of the program; the device nodes are files.
. "$(dirname "$0")/common.sh"

# The launcher finds its programs from its own place.
launcher=$FOLDER/bin/zarvo-demo
mkdir -p "$FOLDER/bin" "$FOLDER/dev" "$FOLDER/libexec/zarvo" "$FOLDER/lib"
sed "s|^NODES=.*|NODES='$FOLDER/dev/zarvo_'|; s|^LOG_BYTES=.*|LOG_BYTES=400|" "$ZARVO_BUILD/packaging/zarvo-demo" >"$launcher"
stand_in=$FOLDER/bin/$(sed -n 's|^programs=.here/||p' "$launcher")/zarvo_demo
mkdir -p "$(dirname "$stand_in")"
cat >"$stand_in" <<'SCRIPT'
#!/bin/sh
ls
echo "preload $LD_PRELOAD"
echo failure >&2
exit $(cat status)
SCRIPT
chmod -R go+rX "$FOLDER"
chmod +x "$launcher" "$stand_in"

# launch STATUS WORD... -- ARGUMENT...: runs it in "$FOLDER/my folder"; the output must have the words.
launch() {
  local expected=$1 words=() status=0 word
  shift
  while [ "$1" != -- ]; do words+=("$1"); shift; done
  shift
  "${AS[@]}" "$launcher" "$@" </dev/null >"$FOLDER/output" 2>&1 || status=$?
  expect_equal "status of zarvo-demo $* ($(cat "$FOLDER/output"))" "$expected" "$status"
  for word in "${words[@]}"; do
    expect "zarvo-demo $* does not say '$word': $(cat "$FOLDER/output")" grep -qF -- "$word" "$FOLDER/output"
  done
}

AS=(env)
work="$FOLDER/my folder"
mkdir "$work"
echo 0 >"$work/status"
launch 0 'No card found: the virtual card stands in' Videoplayer Data 'preload libzarvo_virtual_card.so' -- "$work"
launch 0 'The virtual card is in use' -- --card virtual "$work"
launch 1 'this machine has no card' enc0 -- --card real "$work"
launch 2 "'other' is no card" -- --card=other "$work"
launch 2 'one folder is enough' -- "$work" "$work"
launch 1 'cannot be used' -- "$launcher"
expect "a line of the log without time" grep -qE '^20[0-9]{2}-[0-9]{2}-[0-9]{2} [0-9:]{8} failure$' "$work/zarvo-demo.log"
for _ in 1 2 3; do launch 0 -- "$work"; done
for log in zarvo-demo.log zarvo-demo.log.1; do
  expect "$log is too large" test "$(stat -c %s "$work/$log")" -le 400
done

# With a card: it is used if its nodes may be used; else it is said why not.
touch "$FOLDER/dev/zarvo_"{enc0,disp0,vin0}
launch 1 "zarvo_g723_0 is missing" -- "$work"
touch "$FOLDER/dev/zarvo_g723_0"
launch 0 'The card of this machine is in use' -- "$work"
expect "the virtual card is in front of the real one" grep -qx 'preload ' "$FOLDER/output"
chmod 660 "$FOLDER/dev/zarvo_vin0"
if [ "$(id -u)" -eq 0 ]; then # nothing is forbidden to root
  AS=(setpriv --reuid 65534 --regid 65534 --clear-groups)
  chmod 666 "$FOLDER/dev/zarvo_"{enc0,disp0,g723_0}
  launch 1 "zarvo_vin0: its group is 'root' and its mode 660" -- "$work"
  chgrp video "$FOLDER/dev/zarvo_vin0"
  launch 1 "zarvo_vin0: you are not in the group 'video'" -- "$work"
fi
rm "$FOLDER/dev"/*

# In a terminal: it waits after an error, so that the reason can be read, and only then.
AS=(env)
echo 7 >"$work/status"
launch 7 'ended with status 7' -- "$work"
mkfifo "$FOLDER/keys"
script -qec "'$launcher' '$work'" /dev/null <"$FOLDER/keys" >"$FOLDER/output" 2>&1 &
terminal=$!
exec 4>"$FOLDER/keys"
expect "no question after an error: $(cat "$FOLDER/output")" wait_until 20 grep -q 'Press Return' "$FOLDER/output"
expect "the launcher did not wait" kill -0 "$terminal"
printf '\r' >&4
status=0
wait "$terminal" || status=$?
expect_equal "status after Return" 7 "$status"
