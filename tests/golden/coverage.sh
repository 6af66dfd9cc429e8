#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# coverage.sh GOLDEN_FILE HEADER: cases exist for every function that touches pixels, for those
# only, and no two of them have the same name.
set -euo pipefail
here=$(dirname "${BASH_SOURCE[0]}")
file=$1
header=$2

declared=$("$CC" -E "$header" | awk -f "$here/../package/declared.awk" |
    grep -Ev '^(ovrin_threadpool_|ov_sleep$)' | sort)
covered=$(sed 's/:.*//' "$file" | sort -u)
if ! diff --label "in the header" --label "in the golden file" \
    <(echo "$declared") <(echo "$covered"); then
    echo "the golden file's functions differ from the header's"
    exit 1
fi
twice=$(cut -d ' ' -f 1 "$file" | sort | uniq -d)
if [[ $twice ]]; then
    echo "twice in the golden file: $twice"
    exit 1
fi
echo "$(wc -l <"$file") cases of $(wc -l <<<"$covered") functions"
