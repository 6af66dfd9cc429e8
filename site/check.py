#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""check.py HTML: the site is whole. Each function of the C header is described with exactly its arguments,
and has its page; all links within the site lead somewhere."""
import html.parser
import os
import sys
import urllib.parse

import filter as site

NOTES = ["Threads", "Limits", "Bad input"]


class Page(html.parser.HTMLParser):
    """What a page points to, and what can be pointed to in it."""

    def __init__(self, path):
        super().__init__()
        self.targets, self.anchors, self.text = [], set(), []
        with open(path, encoding="utf-8") as file:
            self.feed(file.read())

    def handle_starttag(self, tag, attributes):
        attributes = dict(attributes)
        for key in ("href", "src"):
            if attributes.get(key):
                self.targets.append(attributes[key])
        self.anchors.update(attributes[key] for key in ("id", "name") if attributes.get(key))

    def handle_data(self, data):
        self.text.append(data)


def check_tables(failures):
    functions = site.prototypes(site.read("include/ovrinresize.h"))
    tables = site.function_tables()
    for name in sorted(set(functions) ^ set(tables)):
        failures.append("%s is not in both docs/functions.md and the header" % name)
    for name in set(functions) & set(tables):
        arguments, notes = tables[name]
        described = [one for names, _ in arguments for one in names]
        if sorted(described) != sorted(functions[name]):
            failures.append("%s takes %s, docs/functions.md has %s" % (name, functions[name], described))
        if [title for title, _ in notes] != NOTES:
            failures.append("docs/functions.md does not say %s of %s" % (NOTES, name))
    return functions


def check_functions(functions, pages, failures):
    for name, arguments in functions.items():
        wanted = [name + "()"] + NOTES + (["Parameters"] if arguments else [])
        groups = [page for path, page in pages.items() if path.startswith("group__")]
        if not any(all(word in "".join(page.text) for word in wanted) for page in groups):
            failures.append("no page describes %s" % name)


def check_links(folder, pages, failures):
    count = 0
    for path, page in pages.items():
        for target in page.targets:
            parts = urllib.parse.urlsplit(target)
            if parts.scheme or target.startswith("//"):
                continue
            count += 1
            file = urllib.parse.unquote(parts.path) or path
            if not os.path.exists(os.path.join(folder, file)):
                failures.append("%s: %s is not there" % (path, target))
            elif parts.fragment and file in pages:
                if urllib.parse.unquote(parts.fragment) not in pages[file].anchors:
                    failures.append("%s: %s has no such place" % (path, target))
    return count


def main():
    folder = sys.argv[1]
    failures = []
    pages = {name: Page(os.path.join(folder, name))
             for name in sorted(os.listdir(folder)) if name.endswith(".html")}
    functions = check_tables(failures)
    check_functions(functions, pages, failures)
    links = check_links(folder, pages, failures)
    print("\n".join(failures[:50]))
    print("%d functions, %d pages, %d links, %d mistakes" % (len(functions), len(pages), links, len(failures)))
    sys.exit(1 if failures or not functions or not links else 0)


if __name__ == "__main__":
    main()
