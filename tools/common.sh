# shellcheck shell=bash
# Functions that demo.sh, test.sh and the end-to-end tests share. To be sourced, not run.

ZARVO_ROOT=$(cd "$(dirname "${BASH_SOURCE[0]}")/.." && pwd)

say() { printf '\n== %s\n' "$*"; }

die() {
  printf 'error: %s\n' "$*" >&2
  exit 1
}

# install_missing: installs the missing packages of tools/packages.txt, without questions.
install_missing() {
  local as_root=() missing=() package
  command -v dpkg-query >/dev/null && command -v apt-get >/dev/null ||
    die "this script installs its tools with apt-get (Debian 12); elsewhere install the packages of tools/packages.txt yourself"
  while read -r package; do
    dpkg-query -W -f '${db:Status-Status}\n' "$package" 2>/dev/null | grep -qx installed || missing+=("$package")
  done < <(grep -v '^#' "$ZARVO_ROOT/tools/packages.txt")
  [ ${#missing[@]} -gt 0 ] || return 0
  if [ "$(id -u)" -ne 0 ]; then
    command -v sudo >/dev/null || die "these packages are missing and need root to install: ${missing[*]}"
    as_root=(sudo)
  fi
  say "Installing ${#missing[@]} missing packages with apt-get: ${missing[*]}"
  "${as_root[@]}" apt-get update -q
  "${as_root[@]}" env DEBIAN_FRONTEND=noninteractive apt-get install -q -y --no-install-recommends "${missing[@]}"
}

# build PRESET [TARGET...] [-- CMAKE-OPTION...]: configures and builds build/PRESET, with ccache if it is installed.
build() {
  local preset=$1 targets=() options=()
  shift
  while [ $# -gt 0 ] && [ "$1" != -- ]; do
    targets+=("$1")
    shift
  done
  [ $# -eq 0 ] || options=("${@:2}")
  if command -v ccache >/dev/null; then
    options+=(-DCMAKE_C_COMPILER_LAUNCHER=ccache -DCMAKE_CXX_COMPILER_LAUNCHER=ccache)
  fi
  (cd "$ZARVO_ROOT" && cmake --preset "$preset" "${options[@]}" >/dev/null &&
    cmake --build --preset "$preset" -j "$(nproc)" ${targets[0]:+--target "${targets[@]}"})
}

# real_card: whether this machine has a card.
real_card() { [ -e /dev/zarvo_enc0 ]; }

# use_card CARD-LIBRARY: sets the array ON_CARD to a command prefix. "${ON_CARD[@]}" PROGRAM ... runs the
# program on the card of this machine if there is one, else on the virtual card. A program built with a
# sanitizer needs the sanitizer's runtime before the card. ZARVO_PRELOAD names one more library, after the card.
# LD_PRELOAD has no quoting, so it holds only the name of the card; LD_LIBRARY_PATH holds its folder.
use_card() {
  local runtime folder
  ON_CARD=(env)
  ! real_card || return 0
  [ -f "$1" ] || die "the virtual card $1 is not built"
  folder=$(cd "$(dirname "$1")" && pwd)
  case $folder in *[:\;]*) die "the virtual card cannot be put in front of a program from a folder with ':' or ';' in its name: $folder" ;; esac
  runtime=$(ldd "$1" | awk '/lib(asan|tsan)\.so/ && !found++ { print $3 }')
  ON_CARD+=("LD_LIBRARY_PATH=$folder${LD_LIBRARY_PATH:+:$LD_LIBRARY_PATH}"
    "LD_PRELOAD=${runtime:+$runtime:}${1##*/}${ZARVO_PRELOAD:+:$ZARVO_PRELOAD}${LD_PRELOAD:+:$LD_PRELOAD}")
}

# wait_until SECONDS COMMAND...: repeats the command until it succeeds; fails after that time.
wait_until() {
  local latest=$((SECONDS + $1))
  shift
  until "$@" >/dev/null 2>&1; do
    [ "$SECONDS" -lt "$latest" ] || return 1
    sleep 0.05
  done
}
