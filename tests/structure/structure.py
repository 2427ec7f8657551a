#!/usr/bin/python3
# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""Checks by search that a tree keeps the house's rules: which room knows which, and what stays out of a room.

usage: structure.py TREE

The arrows are those of the drawing in CONTRIBUTING.md, which is read here: a room may include itself and what an arrow
leads to, however far.
"""

import graphlib
import os
import re
import sys

CORE = r"src/(frontend|settings|startupdisk)/"
CODE = r"src/.*\.(cpp|h)$"
ANY_CODE = r"(src|tests|packaging)/.*\.(cpp|h)$"
SOURCE = r"(src/[^/]+|tests)/.*\.cpp$"
LONGEST_SOURCE = 360
FULLEST_FOLDER = 42

# What is forbidden, in which files (a pattern on the path), and as what (a pattern on the line).
RULES = [
    ("no library but the standard one here", CORE + r"|src/platform/|src/(base|effects)/.*\.h$", r"#include <[^>]*[./]"),
    ("pugixml is hidden in the XML of PropertyList", r"src/(?!base/PropertyListXml).*\.(cpp|h)$", r"pugi"),
    ("pugixml is linked without its streams and XPath", r"src/base/PropertyListXml", r"stream|xpath|select_node|\.(load|save)\("),
    ("the program starts without streams", r"src/", r"#include <(\w*stream(buf)?|iomanip)>"),
    ("the JSON library is hidden in what reads wanted values and logs",
     r"src/(?!control/apply/WantedFile\.cpp|hosts/scratch/ScratchLogs\.cpp)", r"nlohmann"),
    ("every wait goes through RunLoop", r"src/(?!base/RunLoop)", r"#include <sys/(epoll|eventfd|timerfd)\.h>"),
    ("one source asks which host it is", r"src/(?!hosts/ChosenHost\.)", r"TAVISK_HOST"),
    ("handlers print on the stream they are given, and never end the process", CORE,
     r"\bstdout\b|std::c(out|err)\b|std::(printf|puts|putchar|exit|_Exit|quick_exit|abort)\("),
    ("standard error is the front end's", r"src/(settings|startupdisk)/", r"\bstderr\b"),
    ("no shell", r"src/", r"(?<![\w.>])(system|popen)\("),
    ("builds are reproducible", r"src/", r"__(DATE|TIME)__"),
    ("no web addresses in scripts", r"(script|cmake|\.ci)/", r"https?:/(?!/www\.w3\.org/2000/svg)"),
    ("the tool's own files are named in one place", r"src/(?!hosts/linux/system/OwnFiles\.h)", r"60-tavisk"),
    ("reasons are for people: a failure is asked for its code", r"src/", r"\.why\.(starts_with|ends_with|find|compare)|\.why [!=]="),
    ("one kind of lock guard", ANY_CODE, r"std::lock_guard"),
    ("a pointer is asked as it is", ANY_CODE, r"\b(if|while) \([^;]*[!=]= nullptr|[!=]= nullptr (\?|&&|\|\|)"),
    ("what implements an interface is final", r"src/(?!platform/|hosts/shared/|startupdisk/SDController\.h)", r"^(class|struct) \w+ : public"),
    ("algorithms take ranges", ANY_CODE,
     r"std::(find|any_of|all_of|none_of|sort|stable_sort|copy|transform|count|replace)(_if)?\(\w+(\.|->)begin\(\)"),
]


def files_of(tree):
    for folder, folders, names in os.walk(tree):
        if "CMakeCache.txt" in names:
            folders.clear()
            continue
        folders[:] = sorted(set(folders) - {".git", ".cache", "build", "dist", "__pycache__"})
        for name in sorted(names):
            yield os.path.relpath(os.path.join(folder, name), tree)


def rule_faults(path, lines):
    for rule, paths, pattern in RULES:
        if re.match(paths, path):
            for number, line in enumerate(lines, 1):
                if re.search(pattern, line):
                    yield f"{path}:{number}: {rule}: {line.strip()}"


def form_faults(path, text):
    lines = text.splitlines()
    if not (len(lines) > 1 and "SPDX-FileCopyrightText" in lines[0] and "SPDX-License-Identifier" in lines[1]):
        yield f"{path}:1: the two licence lines are missing"
    if len(lines) > LONGEST_SOURCE:
        yield f"{path}: {len(lines)} lines; at most {LONGEST_SOURCE}"
    if "namespace tavisk {\n\nnamespace {" in text:
        yield f"{path}: a blank line between the two namespaces"


def arrows_of(contributing):
    """The arrows of the drawing, from folder to folder: a line "A --> B" is one, "NAME[FOLDER]" a room."""
    rooms = dict(re.findall(r"(\w+)\[([\w./ ]+)\]", contributing))
    return [(rooms[a], rooms[b]) for a, targets in re.findall(r"^ *(\w+) --> ([\w &]+)$", contributing, re.M)
            for b in targets.split(" & ")]


def reach_of(arrows):
    """What each room may include."""
    reach = {room: {room} for arrow in arrows for room in arrow}
    for _ in reach:
        for source, target in arrows:
            reach[source] |= reach[target]
    return reach


def room_of(path, rooms):
    return max((room for room in rooms if path == room or path.startswith(room + "/")), key=len, default=None)


def includes_of(text):
    return re.findall(r'^#include "([^"]+)"', text, re.M)


def arrow_faults(code, arrows, reach):
    used = set()
    for path, text in code.items():
        room = room_of(path.removeprefix("src/"), reach)
        if room is None:
            yield f"{path}: CONTRIBUTING.md does not know this room"
            continue
        for included in includes_of(text):
            used.add((room, room_of(included, reach)))
            if room_of(included, reach) not in reach[room]:
                yield f"{path}: no arrow leads from {room} to {included}"
    for source, target in arrows:
        if (source, target) not in used:
            yield f"CONTRIBUTING.md: nothing follows the arrow from {source} to {target}"


def circle_faults(code):
    """Headers that include each other, however far round."""
    try:
        graphlib.TopologicalSorter({path.removeprefix("src/"): includes_of(text) for path, text in code.items()}).prepare()
    except graphlib.CycleError as circle:
        yield "include circle: " + " -> ".join(circle.args[1])


def folder_faults(paths):
    folders = [os.path.dirname(path) for path in paths if path.startswith("src/")]
    for folder in sorted(set(folders)):
        if folders.count(folder) > FULLEST_FOLDER:
            yield f"{folder}: {folders.count(folder)} files; at most {FULLEST_FOLDER}"


def own_names_of(text):
    """What a source declares in unnamed namespaces, for itself alone."""
    own = "".join(re.findall(r"^namespace \{$(.*?)^\}  // namespace$", text, re.M | re.S))
    pattern = r"^(?:struct|class|enum class) (\w+)|^using (\w+) =|^\w[\w:<>,&* ]*[ &*](\w+)(?:\(|\[\]|\{| = )"
    return {"".join(names) for names in re.findall(pattern, own, re.M)}


def name_faults(texts):
    """The sources of a folder may be compiled as one: a name that two of them have for themselves might be the other's."""
    known = {}
    for path, text in texts.items():
        if re.match(SOURCE, path):
            for name in sorted(own_names_of(text)):
                first = known.setdefault((os.path.dirname(path), name), path)
                if first != path:
                    yield f"{path}: {first} has its own {name} too"


def main(tree):
    texts = {}
    for path in files_of(tree):
        with open(os.path.join(tree, path), encoding="utf-8", errors="replace") as file:
            texts[path] = file.read()
    code = {path: text for path, text in texts.items() if re.match(CODE, path)}
    arrows = arrows_of(texts.get("CONTRIBUTING.md", ""))
    reach = reach_of(arrows)
    faults = [fault for path, text in texts.items() for fault in rule_faults(path, text.splitlines())]
    faults += [fault for path, text in texts.items() if re.match(ANY_CODE, path) for fault in form_faults(path, text)]
    faults += [*arrow_faults(code, arrows, reach), *circle_faults(code), *folder_faults(texts), *name_faults(texts)]
    print("\n".join(faults) if faults else "structure: in order")
    return 1 if faults else 0


if __name__ == "__main__":
    sys.exit(main(sys.argv[1]))
