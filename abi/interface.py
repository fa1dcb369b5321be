#!/usr/bin/env python3
"""Reduces what abidw prints about the library (standard input) to its interface (standard output): the exported symbols,
the classes of ISCSI::TOOL with bases, data members, exported and virtual functions, and of each other type that these
mention its name and size. Types are known by their names and stand in order, so that a difference can be read."""
import re
import sys
import xml.etree.ElementTree as xml

OURS = "ISCSI::TOOL::"
corpus = xml.parse(sys.stdin).getroot()
found = {}  # identifier given by abidw: (element, qualified name)
names = {}  # identifier: readable name
shown = {}  # readable name: element


def collect(element, scope):
    for child in element:
        name = scope + child.get("name", "")
        if child.get("id") and "declaration" not in str(child.attrib) or child.get("id") not in found:
            found[child.get("id")] = (child, name)
        collect(child, name + "::" if child.get("name") else scope)


def readable(identifier):
    element, name = found[identifier]
    target = readable(element.get("type-id")) if element.get("type-id") and element.tag != "typedef-decl" else None
    return {
        "pointer-type-def": lambda: f"{target}*",
        "reference-type-def": lambda: target + ("&&" if element.get("kind") == "rvalue" else "&"),
        "qualified-type-def": lambda: target + "".join(f" {word}" for word in ("const", "volatile") if element.get(word)),
        "array-type-def": lambda: target + "".join(f"[{part.get('length')}]" for part in element),
    }.get(element.tag, lambda: re.sub(r"std::(__cxx11::)?basic_string<char,.*?> >", r"std::\1string", name))()


def exported(member):
    return member.tag == "member-function" and member[0].get("elf-symbol-id")


def relied_on(member):
    return member.tag in ("base-class", "data-member") or member.get("vtable-offset") or exported(member)


def show(identifier):
    name, element = names[identifier], found[identifier][0]
    if name not in shown:
        shown[name] = element
        element.set("id", name)
        if element.tag == "class-decl":
            element[:] = [child for child in element if name.startswith(OURS) and relied_on(child)]
            element.set("name", name.replace(OURS, ""))
        point_to_names(element)
    return name


def point_to_names(element):
    if element.get("type-id"):
        element.set("type-id", show(element.get("type-id")))
    for child in element:
        point_to_names(child)


collect(corpus, "")
names.update((identifier, readable(identifier)) for identifier in found)
for identifier, (element, name) in list(found.items()):
    if element.tag == "class-decl" and name.startswith(OURS) and any(exported(child) for child in element):
        show(identifier)

for unit in corpus.findall("abi-instr"):
    corpus.remove(unit)
unit = xml.SubElement(corpus, "abi-instr", {"address-size": sys.argv[1], "path": "interface", "language": "LANG_C_plus_plus"})
space = xml.SubElement(xml.SubElement(unit, "namespace-decl", name="ISCSI"), "namespace-decl", name="TOOL")
for name in sorted(shown):
    (space if name.startswith(OURS) and shown[name].tag == "class-decl" else unit).append(shown[name])
xml.indent(corpus)
xml.ElementTree(corpus).write(sys.stdout, encoding="unicode")
