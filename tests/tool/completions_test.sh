#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# What shells complete is what --help lists: options, and the words that they take.
# Usage: completions_test.sh PATH_OF_OVRINRESIZE IGNORED FOLDER_OF_COMPLETIONS
completions=$(realpath "$3")
source "$(dirname "${BASH_SOURCE[0]}")/support.sh"

# options_of COMMAND: those that --help lists; where there is no command, those for resizing.
options_of() {
    # shellcheck disable=SC2086 # no word where there is none
    "$tool" $1 --help | grep -oE '^  (-[a-zA-Z], )?--[^ ].*' | grep -oE '^  (-[a-zA-Z], )?--[a-z-]+(, --[a-z-]+)?' |
        grep -oE -e '--[a-z-]+' | sort -u
}
options=$(for command in '' info compare selftest; do options_of "$command"; done | sort -u)
# Every engine that the tool knows, from its own complaint about one that it does not.
engines=$("$tool" a b -s 1x1 -e none 2>&1 | sed 's/.*none of: //')
[ "$(wc -w <<<"$options")" -ge 30 ] || complain "no options found in --help"
[ "$(wc -w <<<"$engines")" -ge 6 ] || complain "no engines found"

for shell in ovrinresize.bash _ovrinresize ovrinresize.fish; do
    for option in $options; do
        name=$option
        [ $shell != ovrinresize.fish ] || name="-l ${option#--}"
        grep -q -e "${name}[^a-z-]" "$completions/$shell" || complain "$shell lacks $option"
    done
    grep -q -e "$engines" "$completions/$shell" || complain "$shell lacks one of: $engines"
done

# As bash calls it.
# shellcheck source=/dev/null
source "$completions/ovrinresize.bash"
completed() {
    COMP_WORDS=(ovrinresize "$@")
    COMP_CWORD=$#
    _ovrinresize
    echo "${COMPREPLY[*]}"
}
[ "$(completed --engine l)" = lanczos ] || complain "--engine l: $(completed --engine l)"
[ "$(completed in.png out.png --no-r)" = --no-rotate ] || complain "--no-r: $(completed --no-r)"
touch help
[ "$(completed he)" = help ] || complain "file names: $(completed he)"
[ "$(completed sel)" = selftest ] || complain "commands: $(completed sel)"
[ "$(completed compare a.png b.png --max-d)" = --max-diff ] || complain "compare: $(completed compare --max-d)"
[ "$(completed --range l)" = limited ] || complain "--range: $(completed --range l)"
for command in resize info compare selftest; do
    wanted=$(options_of "${command#resize}" | xargs)
    found=$(completed "$command" -- | tr ' ' '\n' | sort | xargs)
    [ "$found" = "$wanted" ] || complain "$command: completes $found, not $wanted"
done

for shell in "zsh -n:_ovrinresize" "fish -n:ovrinresize.fish"; do
    command -v "${shell%% *}" >/dev/null || continue
    ${shell%%:*} "$completions/${shell#*:}" || complain "${shell%% *} cannot read ${shell#*:}"
done

finish
