#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""search.py HTML: Doxygen's search finds names by their beginning only. This lets it find the C functions,
nearly all of which begin alike, by each later word of their name too: ovrin_resize_nv21 by nv21."""
import os
import re
import sys

import filter as site


def read(path):
    with open(path, encoding="utf-8") as file:
        return file.read()


def main():
    folder = os.path.join(sys.argv[1], "search")
    # The first list of letters is that of all names; a letter's place in it, in hex, names its file.
    letters = re.search(r'0: "(.*?)"', read(os.path.join(folder, "searchdata.js"))).group(1)
    files = {letter: os.path.join(folder, "all_%x.js" % at) for at, letter in enumerate(letters)}
    texts = {letter: read(path) for letter, path in files.items()}
    found = re.findall(r"^  \['.*?',(\['(\w+)',.*\])\],?$", "\n".join(texts.values()), flags=re.M)
    entries = {name: entry for entry, name in found}
    added = 0
    for name in site.prototypes(site.read("include/ovrinresize.h")):
        for cut in re.finditer("(?<=[a-z0-9])_(?=.)", name):
            words = name[cut.end():].lower()
            if words[0] not in texts:
                continue  # no name begins with that letter, so Doxygen has no file for it
            row = "  ['%s_x%d',%s]" % (words.replace("_", "_5f"), added, entries[name])
            added += 1
            texts[words[0]] = texts[words[0]].replace("\n];", ",\n%s\n];" % row)
    for letter, path in files.items():
        with open(path, "w", encoding="utf-8") as file:
            file.write(texts[letter])


if __name__ == "__main__":
    main()
