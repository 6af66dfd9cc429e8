#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# exports.sh LIBRARY: it exports exactly the functions that the public header declares.
set -euo pipefail
here=$(dirname "${BASH_SOURCE[0]}")
source "$here/skip.sh"
library=$1

# The compiler says which lines are the header's own, so that a declaration without the export mark,
# or one laid out unusually, counts as well.
declared=$("$CC" -E "$SOURCE_DIR/include/ovrinresize.h" | awk -f "$here/declared.awk" | sort)
# Type A is the version node.
exported=$("$NM" -D --defined-only "$library" | awk '$2 != "A" { sub(/@.*/, "", $3); print $3 }' | sort)

if [[ ! $declared ]]; then
    echo "no function found in the header"
    exit 1
fi
if ! diff --label declared --label exported <(echo "$declared") <(echo "$exported"); then
    echo "exports differ from the header (< declared only, > exported only)"
    exit 1
fi
echo "$(wc -l <<<"$declared") functions declared and exported"
