#!/usr/bin/python3
# SPDX-License-Identifier: Apache-2.0
"""check_repository.py FOLDER: what Gradle and Maven ask of the repository that make_aar.py writes.

Says for each rule whether it holds; ends with 1 if one does not."""
import hashlib
import io
import json
import os
import re
import sys
import xml.etree.ElementTree as ElementTree
import zipfile

HASHES = ("md5", "sha1", "sha256", "sha512")
SUFFIXES = (".aar", ".module", ".pom", "-javadoc.jar", "-sources.jar")
POM = "{http://maven.apache.org/POM/4.0.0}"
MARKER = "<!-- do_not_remove: published-with-gradle-metadata -->"


class Repository:
    def __init__(self, root):
        self.files = {}
        for parent, _, names in os.walk(root):
            for name in names:
                path = os.path.join(parent, name)
                with open(path, "rb") as file:
                    self.files[os.path.relpath(path, root)] = file.read()
        module, = (path for path in self.files if path.endswith(".module"))
        *group, self.name, self.version, _ = module.split("/")
        self.group = ".".join(group)
        self.folder = os.path.dirname(module)
        self.module = json.loads(self.files[module])

    def of(self, suffix):
        return self.files[f"{self.folder}/{self.name}-{self.version}{suffix}"]

    def variants(self, **attributes):
        wanted = {f"org.gradle.{name}": value for name, value in attributes.items()}
        return [v for v in self.module["variants"] if wanted.items() <= v["attributes"].items()]

    def dependencies(self):
        """Of the pom, as (group, module, version)."""
        project = ElementTree.fromstring(self.of(".pom"))
        return [tuple(d.findtext(POM + tag) for tag in ("groupId", "artifactId", "version"))
                for d in project.iter(POM + "dependency")]


# Each rule gives a list of complaints.


def rule_layout(repository):
    prefix = f"{repository.folder}/{repository.name}-{repository.version}"
    wanted = {prefix + suffix for suffix in SUFFIXES}
    wanted.add(f"{os.path.dirname(repository.folder)}/maven-metadata.xml")
    wanted |= {f"{path}.{name}" for path in wanted for name in HASHES}
    for path in sorted(wanted ^ set(repository.files)):
        yield f"{path} is {'missing' if path in wanted else 'left over'}"


def rule_sums(repository):
    for path, content in repository.files.items():
        base, _, kind = path.rpartition(".")
        if kind in HASHES and base in repository.files:
            if content.decode() != hashlib.new(kind, repository.files[base]).hexdigest():
                yield f"{path} is not that of the file"


def rule_component(repository):
    component = repository.module["component"]
    said = (component["group"], component["module"], component["version"])
    if said != (repository.group, repository.name, repository.version):
        yield f"the metadata name {':'.join(said)}"
    if repository.module["formatVersion"] != "1.1":
        yield f"format {repository.module['formatVersion']}"


def rule_pom(repository):
    text = repository.of(".pom").decode()
    project = ElementTree.fromstring(text)
    said = tuple(project.findtext(POM + tag) for tag in ("groupId", "artifactId", "version"))
    if said != (repository.group, repository.name, repository.version):
        yield f"names {':'.join(map(str, said))}"
    if project.findtext(POM + "packaging") != "aar":
        yield "the packaging is not aar"
    if MARKER not in text:
        yield "does not lead Gradle to its metadata"


def rule_variants(repository):
    for usage in ("java-api", "java-runtime"):
        found = repository.variants(category="library", libraryelements="aar", usage=usage)
        if len(found) != 1:
            yield f"{len(found)} libraries for {usage}"
    for kind in ("sources", "javadoc"):
        if len(repository.variants(category="documentation", docstype=kind)) != 1:
            yield f"not one variant of {kind}"


def rule_files(repository):
    for variant in repository.module["variants"]:
        for file in variant["files"]:
            content = repository.files.get(f"{repository.folder}/{file['url']}")
            if content is None:
                yield f"{variant['name']}: no file {file['url']}"
                continue
            if file["size"] != len(content):
                yield f"{variant['name']}: {file['url']} has {len(content)} bytes"
            for name in HASHES:
                if file[name] != hashlib.new(name, content).hexdigest():
                    yield f"{variant['name']}: another {name} of {file['url']}"


def rule_dependencies(repository):
    """Both kinds of metadata name the same ones, and Kotlin's library where there are classes."""
    with zipfile.ZipFile(io.BytesIO(repository.of(".aar"))) as aar:
        with zipfile.ZipFile(io.BytesIO(aar.read("classes.jar"))) as classes:
            needs_kotlin = bool(classes.namelist())
    in_pom = repository.dependencies()
    if needs_kotlin != any(name == "kotlin-stdlib" for _, name, _ in in_pom):
        yield f"the pom names {in_pom}"
    for variant in repository.variants(category="library"):
        said = [(d["group"], d["module"], d["version"]["requires"])
                for d in variant.get("dependencies", [])]
        if said != in_pom:
            yield f"{variant['name']} names {said}, the pom {in_pom}"


def rule_versions(repository):
    metadata = ElementTree.fromstring(
        repository.files[f"{os.path.dirname(repository.folder)}/maven-metadata.xml"])
    for tag in ("versioning/latest", "versioning/release", "versioning/versions/version"):
        if metadata.findtext(tag) != repository.version:
            yield f"{tag} is {metadata.findtext(tag)}"


def rule_sources(repository):
    """Each class has its source, and each source its page when it declares something public."""
    with zipfile.ZipFile(io.BytesIO(repository.of(".aar"))) as aar:
        with zipfile.ZipFile(io.BytesIO(aar.read("classes.jar"))) as classes:
            names = {re.sub(r"(Kt|\$.*)?\.class$", "", n) for n in classes.namelist()
                     if n.endswith(".class")}
    with zipfile.ZipFile(io.BytesIO(repository.of("-sources.jar"))) as jar:
        text = b"".join(jar.read(name) for name in jar.namelist()).decode()
        files = {name[:-3] for name in jar.namelist() if name.endswith(".kt")}
    for name in sorted(names):
        declared = re.search(rf"\b(class|object) {name.rpartition('/')[2]}\b", text)
        if name not in files and not declared:
            yield f"no source of {name}"
    with zipfile.ZipFile(io.BytesIO(repository.of("-javadoc.jar"))) as jar:
        index = jar.read("index.html").decode()
        pages = {name for name in jar.namelist() if name.endswith(".html")}
    for page in sorted(pages - {"index.html"}):
        if f'href="{page}"' not in index:
            yield f"the index does not name {page}"
    if names and not {"Resizer.html", "CameraFrame.html", "Bitmaps.html"} <= pages:
        yield f"pages are missing: {sorted(pages)}"


RULES = [rule_layout, rule_sums, rule_component, rule_pom, rule_variants, rule_files,
         rule_dependencies, rule_versions, rule_sources]


def complaints(root):
    """The names of the rules that the repository breaks, with what is wrong."""
    repository = Repository(root)
    broken = {}
    for rule in RULES:
        try:
            found = list(rule(repository))
        except (KeyError, ElementTree.ParseError, zipfile.BadZipFile) as error:
            found = [f"cannot be read: {error!r}"]
        if found:
            broken[rule.__name__[len("rule_"):]] = found
    return broken


def main():
    broken = complaints(sys.argv[1])
    for rule in RULES:
        name = rule.__name__[len("rule_"):]
        print(f"{'BROKEN' if name in broken else 'ok':7}{name}")
        for complaint in broken.get(name, []):
            print(f"       {complaint}")
    sys.exit(1 if broken else 0)


if __name__ == "__main__":
    main()
