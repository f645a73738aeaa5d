# shellcheck shell=bash
# Functions that demo.sh, test.sh and the end-to-end tests share. To be sourced, not run.

ZARVO_ROOT=$(cd "$(dirname "${BASH_SOURCE[0]}")/.." && pwd)

say() { printf '\n== %s\n' "$*"; }

die() {
  printf 'error: %s\n' "$*" >&2
  exit 1
}

# plain_root: lets ZARVO_ROOT be a link to the tree if the path of the tree has characters that CMake, ninja,
# the dynamic linker or xdotool cannot deal with: quotes, ':', ';', '&', letters that the locale does not have, ...
# The link is the same for each run, because builds keep the path.
plain_root() {
  local LC_ALL=C folder link
  case $ZARVO_ROOT in *[!A-Za-z0-9/._+\ -]*) ;; *) return 0 ;; esac
  folder=/tmp/zarvo-$(id -u)
  link=$folder/$(printf %s "$ZARVO_ROOT" | cksum | tr ' ' -)
  mkdir -m 700 "$folder" 2>/dev/null || { [ -O "$folder" ] && [ ! -L "$folder" ]; } || die "$folder is not yours"
  [ "$(readlink "$link")" = "$ZARVO_ROOT" ] || ln -sfn "$ZARVO_ROOT" "$link"
  ZARVO_ROOT=$link
}
plain_root

# install_missing NOTE LIST...: installs, without questions, the packages of tools/packages-LIST.txt that are
# missing. Its first line says how much is fetched; the note ends that line.
install_missing() {
  local note=$1 missing names size reached=1 quiet=() as_root=() apt=(env LC_ALL=C DEBIAN_FRONTEND=noninteractive apt-get)
  shift
  type dpkg-query apt-get >/dev/null 2>&1 ||
    die "this script installs packages with apt-get (Debian 12); elsewhere install what tools/packages-*.txt list yourself"
  mapfile -t missing < <(for list; do cat "$ZARVO_ROOT/tools/packages-$list.txt"; done | grep -v '^#' |
    grep -vxFf <(dpkg-query -W -f '${db:Status-Status} ${Package}\n' | sed -n 's/^installed //p'))
  [ ${#missing[@]} -gt 0 ] || return 0
  names=${missing[*]}
  if [ "$(id -u)" -ne 0 ]; then
    sudo true 2>/dev/null || die "these packages are missing, and installing them needs root: $names"
    as_root=(sudo)
  fi
  apt=("${as_root[@]}" "${apt[@]}" -o Acquire::Retries=2 -o Acquire::http::Timeout=30)
  "${apt[@]}" update -qq -o APT::Update::Error-Mode=any || reached=0
  size=$("${apt[@]}" install --assume-no --no-install-recommends "${missing[@]}" | sed -nE \
    's/^Need to get (.*) of archives.*/\1 to fetch, /p; s/^After this operation, (.*) of additional.*/\1 on disk/p' | tr -d '\n' || true)
  if [ -z "$size" ]; then
    [ $reached -eq 1 ] || die "cannot reach the package servers; these packages are missing: $names"
    die "the package servers of this system do not have all these packages (those of Debian 12 do): $names"
  fi
  say "Installing ${#missing[@]} missing packages: $size. $note"
  [ $reached -eq 1 ] || quiet=(-qq) # apt has said why
  "${apt[@]}" "${quiet[@]}" install -y --no-install-recommends --download-only "${missing[@]}" ||
    die "cannot reach the package servers; these packages are missing: $names"
  "${apt[@]}" install -y --no-install-recommends "${missing[@]}" || die "apt-get cannot install these packages: $names"
}

# build PRESET [TARGET...] [-- CMAKE-OPTION...]: builds build/PRESET, with ccache if it is installed. Configures it
# first if there are options or it is not yet configured for this place: the tree may have been moved.
build() {
  local preset=$1 folder=$ZARVO_ROOT/build/$1 targets=() options=() cache
  shift
  while [ $# -gt 0 ] && [ "$1" != -- ]; do
    targets+=("$1")
    shift
  done
  [ $# -eq 0 ] || options=("${@:2}")
  cache=$folder/CMakeCache.txt
  if [ -f "$cache" ] && ! grep -qxF "CMAKE_HOME_DIRECTORY:INTERNAL=$ZARVO_ROOT" "$cache"; then rm -r "$folder"; fi
  if [ ${#options[@]} -gt 0 ] || [ ! -f "$folder/build.ninja" ]; then
    if command -v ccache >/dev/null; then
      options+=(-DCMAKE_C_COMPILER_LAUNCHER=ccache -DCMAKE_CXX_COMPILER_LAUNCHER=ccache)
    fi
    cmake -S "$ZARVO_ROOT" --preset "$preset" "${options[@]}" >/dev/null || return
  fi
  cmake --build "$folder" -j "$(nproc)" ${targets[0]:+--target "${targets[@]}"}
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

# readme_block LANGUAGE [DOCUMENT]: the code block of the README, or of another document, in that language.
readme_block() { awk -v begin="\`\`\`$1" '$0 == "```" { inside = 0 } inside; $0 == begin { inside = 1 }' "$ZARVO_ROOT/${2:-README.md}"; }
