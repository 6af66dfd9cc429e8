#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""filter.py FILE: the file as Doxygen wants to read it, on standard output.

The sources keep plain comments. Here those of the headers become Doxygen's, the headlines between
sections become groups, and each function of the C header gets its table from docs/functions.md. In
Markdown, links to files that are not on the site become text.
"""
import os
import re
import sys

ROOT = os.path.normpath(os.path.join(os.path.dirname(os.path.abspath(__file__)), ".."))
HEADLINE = re.compile(r"---- (.+?) -+(?:\s|$)")


def read(path):
    with open(os.path.join(ROOT, path), encoding="utf-8") as file:
        return file.read()


def function_tables():
    """Of each function in docs/functions.md: its arguments [(names, text)] and notes [(title, text)]."""
    tables = {}
    for part in re.split(r"^### ", read("docs/functions.md"), flags=re.M)[1:]:
        title, body = part.split("\n", 1)
        rows = re.findall(r"^\| (`.+?) \| (.+) \|$", body, flags=re.M)
        arguments = [(re.findall(r"`(\w+)`", names), text) for names, text in rows]
        notes = re.findall(r"^\*\*(.+?):\*\* ((?:.+\n?)+)", body, flags=re.M)
        for name in re.findall(r"`(\w+)`", title):
            tables[name] = (arguments, notes)
    return tables


def prototypes(header):
    """{function: [argument]} of the C header."""
    found = re.findall(r"^OVRIN_API [^;(]*?(\w+)\((.*?)\);", header, flags=re.M | re.S)
    result = {}
    for name, arguments in found:
        arguments = re.sub(r"\(\*(\w+)\)\([^)]*\)", r"\1", arguments)
        names = [re.search(r"(\w+)\s*$", one) for one in arguments.split(",")]
        result[name] = [one.group(1) for one in names if one.group(1) != "void"]
    return result


def with_lines(text, count):
    """The comment with so many line ends, so that all that follows stays on its line."""
    text = text[:-2].rstrip()
    surplus = text.count("\n") - count
    if surplus > 0:
        head, *tail = text.rsplit("\n", surplus)
        return head + " \\ilinebr ".join(["", *tail]) + " */"
    return text + "\n" * -surplus + " */"


def details(name, tables):
    arguments, notes = tables.get(name, ([], []))  # check.py complains
    lines = [""]
    lines += ["@param %s %s" % (", ".join(names), text) for names, text in arguments]
    if any("C(" in text for _, text in arguments):
        lines.append("\nC(n) is (n + 1) / 2, rounded down: samples of chroma for n of luma.")
    lines += ["@par %s\n%s" % (title, " ".join(text.split())) for title, text in notes]
    return "\n".join(lines)


def body_of(comment):
    """The text of /* ... */, without what frames it."""
    lines = [re.sub(r"^\s*\* ?", "", line) for line in comment[2:-2].strip("\n").split("\n")]
    return "\n".join(lines).strip()


def group(number, title, text):
    """A group of Doxygen's, which ends where the next one begins."""
    end = "/** @} */ " if number > 1 else ""
    return "%s/** @defgroup c%d %s\n%s\n@{ */" % (end, number, title, text)


def c_header(text):
    tables = function_tables()
    groups = 0
    result = []
    last = 0
    for match in re.finditer(r"/\*.*?\*/", text, flags=re.S):
        result.append(text[last:match.start()])
        last = match.end()
        body = body_of(match.group())
        line_before = text[text.rfind("\n", 0, match.start()) + 1:match.start()]
        headline = HEADLINE.match(body)
        function = re.match(r"\nOVRIN_API [^;(]*?(\w+)\(", text[last:])
        if body.startswith("SPDX"):
            comment = match.group()
        elif headline:
            groups += 1
            comment = group(groups, headline.group(1), body[headline.end():].strip())
        elif body.startswith("libovrinresize:"):
            comment = "/** @file\n%s */" % body
        elif line_before.strip():
            comment = "/**< %s */" % body
        elif function:
            comment = "/** %s\n%s */" % (body, details(function.group(1), tables))
        else:
            comment = "/** %s */" % body
        result.append(with_lines(comment, match.group().count("\n")))
    text = "".join(result) + text[last:]
    end = text.rindex("#ifdef __cplusplus")
    return text[:end].rstrip("\n") + "/** @} */\n\n" + text[end:]


def cpp_header(text):
    lines = []
    for line in text.split("\n"):
        if line.startswith("// SPDX"):
            lines.append("/// @file")
        elif HEADLINE.match(line.lstrip("/ ")):
            lines.append("")
        elif re.match(r"\s*//", line):
            lines.append(line.replace("//", "///", 1))
        else:
            lines.append(re.sub(r"(\S.*?)  // (?!namespace)", r"\1  ///< ", line))
    return "\n".join(lines)


def markdown(path, text):
    folder = os.path.dirname(path)

    def link(match):
        words, target = match.groups()
        words = words.strip("`")
        kept = "[%s](%s)" % (words, target)
        if "://" in target:
            return kept
        file = os.path.normpath(os.path.join(folder, target))
        if file.startswith("examples/") and file.endswith(".c"):
            page = os.path.basename(file).replace("_", "__").replace(".", "_8")
            return '<a href="%s_source.html">%s</a>' % (page, words)
        if file == "include/ovrinresize.h":
            return '<a href="ovrinresize_8h.html">%s</a>' % words
        if file.endswith((".md", ".png", ".svg", ".jpg")) and "/bindings/" not in "/" + file:
            return kept
        return words

    # Doxygen takes a percent sign for a mark of its own, in code too.
    text = re.sub(r"(?<!`)`[^`\n]+`(?!`)", lambda code: code.group().replace("%", "%%"), text)
    text = re.sub(r"\[(!\[[^]]*\]\([^)]*\))\]\([^)]*\)", r"\1", text)  # a picture that is a link
    return re.sub(r"(?<!!)\[([^]]*)\]\(([^)]*)\)", link, text)


def main():
    path = os.path.relpath(os.path.abspath(sys.argv[1]), ROOT)
    text = read(path)
    if path == "include/ovrinresize.h":
        text = c_header(text)
    elif path.endswith(".hpp"):
        text = cpp_header(text)
    elif path.endswith(".md"):
        text = markdown(path, text)
    sys.stdout.write(text)


if __name__ == "__main__":
    main()
