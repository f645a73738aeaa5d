#!/usr/bin/env bash
# Adds lines to the documents of a copy of the tree. Catches: a wrong name that tools/check-docs does not see.
set -euo pipefail
cd "$(dirname "${BASH_SOURCE[0]}")/../.."
COPY=$(mktemp -d)
trap 'rm -rf "$COPY"' EXIT
tools/files '*' | xargs -d '\n' cp --parents -t "$COPY"
cd "$COPY"

tools/check-docs || { echo "error: the documents as they are fail" && exit 1; }

while read -r document line; do
  cp "$document" saved
  echo "$line" >>"$document"
  ! tools/check-docs || { echo "error: not seen in $document: $line" && exit 1; }
  mv saved "$document"
done <<'TABLE'
README.md             `sdk/zv_lib/no_such_file.cpp` is here.
README.md             ![A picture](docs/images/no_such_picture.png)
CONTRIBUTING.md       | `no_such_folder/` | | |
docs/threading.md     See [the page](no-such-page.md#part).
docs/architecture.md  | a row | `no_such_function()` in `sdk/command.h` |
docs/architecture.md  | a row | `sdk/command.h`: `no_such_table` |
TABLE
