#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# sbom.sh TREE VERSION CREATED: prints the bill of materials of the sources in TREE in SPDX's tag-value
# form: the package, what its parts need from others, and every file with its checksum. CREATED is a time
# such as 2026-01-31T12:00:00Z, of the commit, so that the same sources give the same bytes.
set -euo pipefail
tree=$1 version=$2 created=$3

# Who needs what: the library itself needs the C library and its maths library only.
needs="glibc:LGPL-2.1-or-later:the library
libpng:libpng-2.0:the command-line tool
libjpeg-turbo:(IJG AND BSD-3-Clause AND Zlib):the command-line tool
libexif:LGPL-2.1-or-later:the command-line tool
CLI11:BSD-3-Clause:the command-line tool, compiled in
nlohmann-json:MIT:the command-line tool, compiled in
wasi-libc:(Apache-2.0 WITH LLVM-exception AND MIT):the WebAssembly modules, compiled in
compiler-rt:Apache-2.0 WITH LLVM-exception:the WebAssembly modules, compiled in
SIMDe:MIT:the WebAssembly modules, compiled in
pybind11:BSD-3-Clause:the Python package, compiled in
NumPy:BSD-3-Clause:the Python package"

# package ID NAME LICENCE [VERSION]
package() {
    printf '\nPackageName: %s\nSPDXID: SPDXRef-Package-%s\n' "$2" "$1"
    [[ ! ${4:-} ]] || echo "PackageVersion: $4"
    printf 'PackageDownloadLocation: NOASSERTION\nFilesAnalyzed: false\n'
    printf 'PackageLicenseConcluded: %s\nPackageLicenseDeclared: %s\nPackageCopyrightText: NOASSERTION\n' "$3" "$3"
}

packages() {
    local name licence whose
    package ovrinresize ovrinresize Apache-2.0 "$version"
    while IFS=: read -r name licence whose; do
        package "$name" "$name" "$licence"
        echo "PackageComment: <text>Needed by $whose.</text>"
        echo "Relationship: SPDXRef-Package-ovrinresize DEPENDS_ON SPDXRef-Package-$name"
    done <<<"$needs"
    echo
}

# Random and passing things of the tool that lists the files become those of the sources.
files=$(reuse --root "$tree" spdx 2>/dev/null | sed \
    -e "s/^DocumentName: .*/DocumentName: ovrinresize-$version/" \
    -e "s|^DocumentNamespace: .*|DocumentNamespace: urn:ovrinresize:$version:$created|" \
    -e "s/^Created: .*/Created: $created/" -e '/^Creator: [PO].*Anonymous/d' \
    -e 's/^LicenseConcluded: .*/LicenseConcluded: Apache-2.0/')
awk -v RS= 'NR == 1' <<<"$files"
echo "Relationship: SPDXRef-DOCUMENT DESCRIBES SPDXRef-Package-ovrinresize"
packages
awk -v RS= -v ORS='\n\n' 'NR > 1' <<<"$files"
