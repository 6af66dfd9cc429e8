# SPDX-License-Identifier: Apache-2.0
"""Pages of the binding's public declarations, with the comments that stand before them."""

import html
import re

STYLE = "body{max-width:60em;margin:2em auto;font-family:sans-serif}pre{background:#eee;padding:.5em}"


def words(comment):
    """The text of a comment without its frame."""
    lines = [re.sub(r"^ *\* ?", "", line) for line in comment.strip().splitlines()]
    return "\n".join(lines).strip()


HIDDEN = re.compile(r"(@\w+ )*(private|internal)\b")
TOP_LEVEL = re.compile(r"[a-z].*\b(class|object|interface)\b")


def declaration_at(lines, i):
    """The declaration that begins in line i, without its body: up to where its brackets close."""
    text = ""
    while i < len(lines):
        text = f"{text} {lines[i].strip()}".strip()
        if not lines[i].strip().startswith("@") and text.count("(") == text.count(")"):
            break
        i += 1
    text = re.sub(r" private constructor\(.*$", "", text)
    if "(" in text:
        return re.sub(r"\)(: \w+)?\s*(=|\{).*$", r")\1", text)
    return re.sub(r"\s*(\{|=|,|;).*$", "", text)


def declarations(source):
    """(comment, declaration) of all that is public in a source file and has a comment."""
    lines = source.splitlines()
    found = []
    is_hidden = False  # inside of a class or an object that is
    for i, line in enumerate(lines):
        if line.strip().startswith("/**"):
            end = next(k for k in range(i, len(lines)) if "*/" in lines[k])
            comment = words("\n".join(lines[i:end + 1]).strip()[3:-2])
            first = end + 1
            text = declaration_at(lines, first)
            if TOP_LEVEL.match(lines[first]):
                is_hidden = bool(HIDDEN.match(text))
            if not is_hidden and not HIDDEN.match(text):
                found.append((comment, text))
        elif TOP_LEVEL.match(line):
            is_hidden = bool(HIDDEN.match(line))
    return found


def page(name, source):
    parts = [f"<!DOCTYPE html><html lang=en><meta charset=utf-8><title>{name}</title>"
             f"<style>{STYLE}</style><h1>{name}</h1>"]
    for comment, declaration in declarations(source):
        parts.append(f"<pre>{html.escape(declaration)}</pre>")
        parts += [f"<p>{html.escape(text)}</p>" for text in comment.split("\n\n")]
    return "\n".join(parts) + "\n"


def pages(sources):
    """A page for each source that declares something public, and an index."""
    result = {}
    for path in sorted(sources):
        name = re.sub(r"^.*/|\.kt$", "", path)
        text = sources[path].decode()
        if declarations(text):
            result[f"{name}.html"] = page(name, text).encode()
    links = "".join(f'<li><a href="{name}">{name[:-5]}</a>' for name in result)
    head = "<!DOCTYPE html><html lang=en><meta charset=utf-8><title>ovrin.resize</title>"
    result["index.html"] = f"{head}<h1>ovrin.resize</h1><ul>{links}</ul>\n".encode()
    return result
