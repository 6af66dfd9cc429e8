#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# compare.sh EXPECTED COMMAND...: the command succeeds and prints what the file holds.
set -euo pipefail
expected=$1
shift
"$@" | diff "$expected" -
