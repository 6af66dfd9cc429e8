#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# archive.sh ARCHIVE: the static library defines the functions of the header, and otherwise only hidden
# names in namespace ovrin, which neither clash with a program's own nor leave what links them.
set -euo pipefail
here=$(dirname "${BASH_SOURCE[0]}")
source "$here/skip.sh"
archive=$1

declared=$("$CC" -E "$SOURCE_DIR/include/ovrinresize.h" | awk -f "$here/declared.awk" | sort)
symbols=$("$READELF" -sW "$archive" |
    awk '($5 == "GLOBAL" || $5 == "WEAK") && $7 != "UND" { print $6, $8 }' | sort -u)
visible=$(awk '$1 == "DEFAULT" { print $2 }' <<<"$symbols" | sort)
if ! diff --label declared --label visible <(echo "$declared") <(echo "$visible"); then
    echo "FAIL: visible names differ from the header"
    exit 1
fi
hidden=$(awk '$1 != "DEFAULT" { print $2 }' <<<"$symbols")
if foreign=$(grep -Ev '^_ZZ?NK?5ovrin' <<<"$hidden"); then
    echo "FAIL: outside namespace ovrin: $foreign"
    exit 1
fi
echo "$(wc -l <<<"$visible") functions, $(wc -l <<<"$hidden") hidden names"
