#!/usr/bin/env bash
# Installs the packages in the system it runs in, uses them as an operator and an integrator do, upgrades and purges
# them. tools/test-packages runs it as root in a fresh Debian 12, where /test has the packages, tools/ and README.md.
set -euo pipefail
# shellcheck source=tools/common.sh
. /test/tools/common.sh
# shellcheck source=tools/streams.sh
. /test/tools/streams.sh
# shellcheck source=tools/operator.sh
. /test/tools/operator.sh
WIDGET_MAP=/test/widget_map
ON_CARD=(env LD_PRELOAD=libzarvo_virtual_card.so)
NAMES=(libzarvo-sdk1 libzarvo-sdk-dev zarvo-virtual-card zarvo-tools zarvo-demo)

# quietly COMMAND...: runs it and shows its output only if it fails.
quietly() { "$@" >/tmp/log 2>&1 || die "$*: $(cat /tmp/log)"; }

install() { quietly apt-get -y --no-install-recommends install "$@"; }

install_packages() {
  say "Installing"
  export DEBIAN_FRONTEND=noninteractive
  echo 'APT::Keep-Downloaded-Packages "true";' >/etc/apt/apt.conf.d/keep
  quietly apt-get update
  install /test/debian/*.deb
  expect_no_missing_library /usr/bin/zarvo_* /usr/libexec/zarvo/*
  # What the test itself uses.
  install xvfb openbox xdotool x11-utils ffmpeg bash-completion cmake make gcc g++ pkg-config
}

# expect_no_missing_library FILE...: catches a package that lacks a dependency.
expect_no_missing_library() { ! ldd "$@" | grep 'not found' || die "a library is missing"; }

# The command of the menu entry opens the dialog, which records, and ends with it.
record_with_dialog() {
  local command
  say "Recording with the dialog, opened by the menu entry"
  read -ra command <<<"$(sed -n 's/^Exec=//p' /usr/share/applications/zarvo-demo.desktop)"
  open_display
  "${command[@]}" >/tmp/log 2>&1 </dev/null &
  DEMO=$!
  LOG=/tmp/log
  wait_until 120 dialog_shown || die "no dialog appeared: $(cat /tmp/log)"
  read_widget_map
  choose comboQualityMode 1
  click btnRecordStart
  wait_line kbps 3
  click btnRecordStop
  close_program
  close_display
  [ "$STATUS" -eq 0 ] || die "the dialog ended with status $STATUS: $(cat /tmp/log)"
  [ -x /root/Zarvo/Videoplayer ] || die "the launcher has prepared no folder"
  [ "$(grep -c kbps /root/Zarvo/zarvo-demo.log)" -ge 3 ] || die "the launcher keeps no log"
  quietly zarvo_export /root/Zarvo/Data/Video/*/CH16/*.rec /root/dialog.mkv
  quietly ffmpeg -nostdin -v error -xerror -i /root/dialog.mkv -f null -
}

record() {
  say "Recording"
  quietly "${ON_CARD[@]}" zarvo_record --seconds 2 --channels 1,16 --output /root/recordings
  report_streams /root/recordings/ch*.m4v /root/recordings/audio*.g726 || die "a recording does not decode"
}

# A clip of what the recorder has written, and the contract of the card.
use_tools() {
  say "Making a clip, and checking the card"
  mkdir -p /root/Data
  quietly "${ON_CARD[@]}" timeout --preserve-status 5 zarvo_recorder --root /root/Data --channels 2 --audio 1
  quietly zarvo_export /root/Data/Video/*/CH02/*.rec /root/clip.mkv
  quietly ffmpeg -nostdin -v error -xerror -i /root/clip.mkv -f null -
  quietly "${ON_CARD[@]}" zarvo_check --quick
}

# build_program LANGUAGE SUFFIX: builds the README's program with CMake and with pkg-config; both must record.
build_program() {
  local folder=/tmp/$1
  say "Building the README's program as $1"
  mkdir "$folder"
  cd "$folder"
  readme_block cmake | sed "s/LANGUAGES C)/LANGUAGES $1)/; s/main\.c/main.$2/" >CMakeLists.txt
  readme_block c >"main.$2"
  quietly cmake -B build
  quietly cmake --build build
  # shellcheck disable=SC2046 # a list of options
  quietly "${3}" "main.$2" $(pkg-config --cflags --libs zarvo-sdk) -o recorder
  for program in build/recorder ./recorder; do
    [[ $(ldd $program) == *libzarvo_sdk.so.1* ]] || die "$program does not use the shared library"
    quietly "${ON_CARD[@]}" $program
    report_streams camera1.m4v || die "the README's program has recorded nothing that decodes"
    rm camera1.m4v
  done
}

# complete_option WORD: what bash completes after zarvo_record.
# shellcheck disable=SC2034 # bash-completion reads these variables
complete_option() {
  set +u
  . /usr/share/bash-completion/bash_completion
  _completion_loader zarvo_record || true
  COMP_WORDS=(zarvo_record "$1") COMP_CWORD=1 COMP_LINE="zarvo_record $1" COMP_POINT=${#COMP_LINE}
  _longopt zarvo_record "$1" zarvo_record
  echo "${COMPREPLY[*]}"
}

upgrade() {
  local package tree=/tmp/tree newer
  say "Upgrading"
  mkdir /tmp/newer
  for package in /test/debian/*.deb; do
    dpkg-deb -R "$package" $tree
    sed -i '/^Version:/s/$/.1/; s/(= \([^)]*\))/(= \1.1)/g' $tree/DEBIAN/control
    quietly dpkg-deb -b $tree /tmp/newer
    rm -r $tree
  done
  install /tmp/newer/*.deb
  newer=$(dpkg-query -W -f '${Version}\n' "${NAMES[@]}" | grep -c '\.1$')
  [ "$newer" -eq ${#NAMES[@]} ] || die "only $newer packages are upgraded"
}

# purge: nothing of the packages may be left, and every recording.
purge() {
  local before left
  say "Removing and purging"
  before=$(find /root -type f -printf '%p %s\n' | sort)
  quietly apt-get -y remove "${NAMES[@]}"
  quietly dpkg --purge "${NAMES[@]}"
  left=$(find / -xdev -path /test -prune -o -path /tmp -prune -o -path /root -prune -o -path /proc -prune -o -iname '*zarvo*' -print)
  [ -z "$left" ] || die "these files are left: $left"
  [ "$before" = "$(find /root -type f -printf '%p %s\n' | sort)" ] || die "the purge has changed the recordings"
}

install_packages
record_with_dialog
record
use_tools
completed=$(complete_option --se)
[ "$completed" = --seconds ] || die "bash completes --se to '$completed'"
build_program C c cc
build_program CXX cpp c++
upgrade
purge
