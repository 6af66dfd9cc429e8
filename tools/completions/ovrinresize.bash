# SPDX-License-Identifier: Apache-2.0
# shellcheck shell=bash

# _ovrinresize_options COMMAND: where it is none, those for resizing.
_ovrinresize_options() {
    case $1 in
        info) echo '--format --input-size --max-pixels --json --help' ;;
        compare)
            echo '--max-diff --format --input-size --range --matrix --no-rotate --max-pixels --json --quiet
                --help'
            ;;
        selftest) echo '--library --json --help' ;;
        *)
            echo '--size --canvas --fit --gravity --engine --format --input-size --range --matrix --threads
                --quality --background --premultiply --no-premultiply --no-rotate --strip --strict --max-pixels
                --output --output-type --recursive --jobs --frames --json --quiet --verbose --help --version'
            ;;
    esac
}

_ovrinresize() {
    local word=${COMP_WORDS[COMP_CWORD]} before=${COMP_WORDS[COMP_CWORD - 1]} words='' more=''
    COMPREPLY=()
    case $before in
        -e | --engine) words='quarter thumbnail bilinear bilinear-progressive lanczos nearest' ;;
        -f | --fit) words='contain exact cover' ;;
        -g | --gravity) words='center north northeast east southeast south southwest west northwest' ;;
        --format) words='nv21 i420 rgba rgb' ;;
        --range) words='full limited' ;;
        --matrix) words='601 709' ;;
        --threads) words='auto 1' ;;
        --background) words='black white gray red green blue yellow cyan magenta' ;;
        -t | --output-type) words='png jpg ppm pgm pnm pam y4m nv21 i420 rgba rgb' ;;
        -s | --size | -c | --canvas | --input-size | -q | --quality | --max-pixels | \
            -o | --output | -j | --jobs | --frames | --max-diff) return ;;
        *)
            [[ $word == -* ]] && words=$(_ovrinresize_options "${COMP_WORDS[1]}")
            # A file may come first, too.
            ((COMP_CWORD > 1)) || more='info compare selftest'
            ;;
    esac
    if [[ $words ]]; then
        mapfile -t COMPREPLY < <(compgen -W "$words" -- "$word")
    else
        mapfile -t COMPREPLY < <(compgen -f -W "$more" -- "$word")
    fi
}
complete -o filenames -F _ovrinresize ovrinresize
