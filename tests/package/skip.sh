# SPDX-License-Identifier: Apache-2.0
# shellcheck shell=bash
# Sourced by the checks that say nothing about an instrumented build.
if [[ ${INSTRUMENTED:-} ]]; then
    echo "skipped: sanitizers or coverage change what is checked here"
    exit 77
fi
