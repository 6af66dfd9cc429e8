# SPDX-License-Identifier: Apache-2.0
# shellcheck shell=bash
_ovrinresize() {
    local word=${COMP_WORDS[COMP_CWORD]} before=${COMP_WORDS[COMP_CWORD - 1]} words=
    COMPREPLY=()
    case $before in
        -e | --engine) words='quarter thumbnail bilinear bilinear-progressive lanczos nearest' ;;
        -f | --fit) words='contain exact cover' ;;
        -g | --gravity) words='center north northeast east southeast south southwest west northwest' ;;
        --format) words='nv21 i420 rgba rgb' ;;
        --background) words='black white gray red green blue yellow cyan magenta' ;;
        -t | --output-type) words='png jpg ppm pgm pnm pam y4m nv21 i420 rgba rgb' ;;
        -s | --size | -c | --canvas | --input-size | -q | --quality | --max-pixels | \
            -o | --output | -j | --jobs | --frames) return ;;
        *)
            [[ $word == -* ]] && words='--size --canvas --fit --gravity --engine --format --input-size
                --quality --background --premultiply --no-premultiply --no-rotate --strip --strict --max-pixels
                --output --output-type --recursive --jobs --frames --json --quiet --verbose --help --version'
            ;;
    esac
    if [[ $words ]]; then
        mapfile -t COMPREPLY < <(compgen -W "$words" -- "$word")
    else
        mapfile -t COMPREPLY < <(compgen -f -- "$word")
    fi
}
complete -o filenames -F _ovrinresize ovrinresize
