#!/usr/bin/python3
# SPDX-License-Identifier: Apache-2.0
"""check_repository_test.py REPOSITORY FOLDER: every rule of check_repository.py can be broken.

For each rule makes a twin of the repository in FOLDER that breaks it and as few others as can be."""
import hashlib
import io
import os
import shutil
import sys
import zipfile

import check_repository


class Twin:
    def __init__(self, root):
        self.root = root
        module, = (os.path.join(parent, name) for parent, _, names in os.walk(root)
                   for name in names if name.endswith(".module"))
        self.stem = module[:-len(".module")]

    def path(self, suffix):
        if suffix == "maven-metadata.xml":
            return os.path.join(os.path.dirname(os.path.dirname(self.stem)), suffix)
        return self.stem + suffix

    def read(self, suffix):
        with open(self.path(suffix), "rb") as file:
            return file.read()

    def write(self, suffix, content):
        """With sums that are right."""
        with open(self.path(suffix), "wb") as file:
            file.write(content)
        for name in check_repository.HASHES:
            with open(f"{self.path(suffix)}.{name}", "w", encoding="ascii") as file:
                file.write(hashlib.new(name, content).hexdigest())

    def replace(self, suffix, old, new):
        content = self.read(suffix)
        if old.encode() not in content:
            raise AssertionError(f"no {old} in {suffix}")
        self.write(suffix, content.replace(old.encode(), new.encode()))


def without_entry(twin, suffix, entry):
    """The archive once more, without one of its files; the module metadata then know other sums."""
    result = io.BytesIO()
    with zipfile.ZipFile(io.BytesIO(twin.read(suffix))) as old, zipfile.ZipFile(result, "w") as new:
        assert any(entry in name for name in old.namelist())
        for name in old.namelist():
            if entry not in name:
                new.writestr(name, old.read(name))
    twin.write(suffix, result.getvalue())


def corrupted_sum(twin):
    with open(twin.path(".aar") + ".sha1", "w", encoding="ascii") as file:
        file.write("0" * 40)


TWINS = {
    "no-pom-sum": (["layout"], lambda t: os.remove(t.path(".pom") + ".md5")),
    "left-over": (["layout"], lambda t: shutil.copy(t.path(".pom"), t.path(".txt"))),
    "other-sum": (["sums"], corrupted_sum),
    "other-component": (["component"],
                        lambda t: t.replace(".module", '"module": "ovrinresize"', '"module": "x"')),
    "other-format": (["component"], lambda t: t.replace(".module", '"1.1"', '"1.0"')),
    "other-pom": (["pom"], lambda t: t.replace(".pom", "<groupId>ovrin<", "<groupId>other<")),
    "jar": (["pom"], lambda t: t.replace(".pom", "<packaging>aar<", "<packaging>jar<")),
    "no-marker": (["pom"], lambda t: t.replace(".pom", "do_not_remove", "removed")),
    "no-runtime": (["variants"],
                   lambda t: t.replace(".module", '"org.gradle.libraryelements": "aar"',
                                       '"org.gradle.libraryelements": "jar"')),
    "no-sources": (["variants"], lambda t: t.replace(".module", '"org.gradle.docstype": "sources"',
                                                     '"org.gradle.docstype": "other"')),
    "other-size": (["files"], lambda t: t.replace(".module", '"size": ', '"size": 1')),
    "other-file": (["files"], lambda t: t.replace(".module", '-sources.jar"', '-source.jar"')),
    "no-kotlin": (["dependencies"], lambda t: t.replace(".pom", "kotlin-stdlib", "kotlin-other")),
    "other-kotlin": (["dependencies"],
                     lambda t: t.replace(".module", '"requires": "', '"requires": "9')),
    "other-version": (["versions"],
                      lambda t: t.replace("maven-metadata.xml", "<latest>", "<latest>9")),
    "source-missing": (["files", "sources"],
                       lambda t: without_entry(t, "-sources.jar", "CameraFrame.kt")),
    "page-missing": (["files", "sources"],
                     lambda t: without_entry(t, "-javadoc.jar", "Resizer.html")),
}


def main():
    repository, folder = sys.argv[1:]
    covered = set()
    failed = False
    for name, (rules, change) in TWINS.items():
        root = os.path.join(folder, name)
        shutil.rmtree(root, ignore_errors=True)
        shutil.copytree(repository, root)
        change(Twin(root))
        broken = check_repository.complaints(root)
        covered |= set(rules)
        if sorted(broken) != sorted(rules):
            print(f"FAIL: {name} breaks {sorted(broken)}, not {sorted(rules)}: {broken}")
            failed = True
    rules = {rule.__name__[len("rule_"):] for rule in check_repository.RULES}
    if covered != rules:
        print(f"FAIL: nothing breaks {sorted(rules - covered)}")
        failed = True
    print(f"{len(TWINS)} twins break the rules that they should" if not failed else "failed")
    sys.exit(1 if failed else 0)


if __name__ == "__main__":
    main()
