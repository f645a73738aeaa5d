#!/usr/bin/env bash
# The one command that tests everything: ./test.sh
#   ./test.sh quick    the release build and its tests only
#   ./test.sh gates    the checks that need no build only
#   ./test.sh packages the Debian packages only: builds them and uses them in a fresh Debian 12
# Stops at the first step that fails, so that its last line is ctest's summary of the release build
# only when all steps before it have passed.
[ -n "${BASH_VERSION:-}" ] || exec bash "$0" "$@" # started as "sh test.sh"
set -euo pipefail
# shellcheck source=tools/common.sh
. "$(dirname "${BASH_SOURCE[0]}")/tools/common.sh"
cd "$ZARVO_ROOT"

# ThreadSanitizer of this compiler cannot live with the address randomisation of newer kernels.
if [ -z "${ZARVO_PLAIN_ADDRESSES:-}" ] && setarch -R true 2>/dev/null; then
  export ZARVO_PLAIN_ADDRESSES=1
  exec setarch -R ./test.sh "$@"
fi

export CTEST_OUTPUT_ON_FAILURE=1
export ASAN_OPTIONS=strict_string_checks=1:detect_stack_use_after_return=1
export UBSAN_OPTIONS=print_stacktrace=1:halt_on_error=1
export TSAN_OPTIONS=halt_on_error=1:second_deadlock_stack=1:suppressions=$ZARVO_ROOT/tests/tsan.supp

# The tree is in order: read by tools only, nothing of it runs.
run_gates() {
  say "Checking format, scripts and spelling"
  tools/files '*.cpp' '*.h' '*.c' | xargs -d '\n' clang-format --dry-run -Werror
  scripts | xargs -d '\n' shellcheck
  tools/files '*' | xargs -d '\n' codespell --quiet-level 2
  say "Checking arrows, documents and lengths"
  tools/check-arrows
  tools/check-docs
  check_lengths
  say "clang-tidy"
  tools/tidy
}

# Scripts say what they are in their first line; some have no suffix.
scripts() {
  tools/files '*' | xargs -d '\n' awk 'FNR == 1 && (/^#!.*sh$/ || /^# shellcheck shell=/) { print FILENAME }'
}

# clang-tidy checks the length of functions.
check_lengths() {
  tools/files '*' | grep -vE '\.(png|gif|svg|ui)$' |
    xargs -d '\n' awk 'FNR == 401 { print FILENAME " has more than 400 lines"; long = 1 } END { exit long }'
}

# Warnings are errors here: what a user's compiler says must not stop his build, ours must.
build_and_test() { # PRESET CTEST-OPTION...
  local preset=$1
  shift
  say "Building $preset"
  build "$preset" -- -DZARVO_WERROR=ON
  say "Testing $preset"
  ctest --test-dir "build/$preset" -j "$(nproc)" "$@"
}

# What a newcomer runs first; the folder has a blank on purpose. It uses the programs of the release build.
smoke_demo() {
  say "Building release"
  build release -- -DZARVO_WERROR=ON
  say "Recording with demo.sh"
  ZARVO_BUILD=$ZARVO_ROOT/build/release ./demo.sh record --force --seconds 3 --output "build/smoke test"
}

mode=${1:-all}
case $mode in
  all | quick | gates) install_missing "Building and testing take most of an hour on two cores." demo tests ;;
  packages) install_missing "Building and testing take half an hour on two cores." demo tests packaging ;;
  *) die "'$mode' is unknown; possible are quick, gates and packages, or nothing for everything" ;;
esac
case $mode in
  gates) run_gates ;;
  quick) build_and_test release ;;
  packages) tools/test-packages ;;
  all)
    run_gates
    build_and_test asan -LE real_time
    build_and_test tsan -LE real_time
    smoke_demo
    build_and_test release
    ;;
esac
