#!/usr/bin/python3
# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""Checks by search that a tree keeps the house's rules: which folder knows which, and what stays out of the tree.

usage: structure.py TREE
"""

import os
import re
import sys

CORE = r"src/(frontend|settings|startupdisk)/"
CODE = r".*\.(cpp|h)$"
LONGEST_SOURCE = 400

# What is forbidden, in which files (a pattern on the path), and as what (a pattern on the line).
RULES = [
    ("the core includes only the core and platform/", CORE,
     r'#include "(?!(frontend|settings|startupdisk|platform)/[^/]+")'),
    ("platform/ includes no other folder", r"src/platform/[^/]+$", r'#include "(?!platform/[^/]+")'),
    ("the Linux host includes only itself and platform/", r"src/platform/linux/",
     r'#include "(?!platform/(linux/.+|[^/]+)")'),
    ("the scratch host includes only itself and platform/", r"src/platform/scratch/",
     r'#include "(?!platform/(scratch/.+|[^/]+)")'),
    ("the terminal knows no host", r"src/terminal/", r'#include "(?!(terminal|frontend|platform)/[^/]+")'),
    ("no library but the standard one here", CORE + r"|src/platform/[^/]+\.h$", r"#include <[^>]*[./]"),
    ("pugixml is hidden in the XML of PropertyList", r"src/(?!platform/PropertyListXml).*\.(cpp|h)$", r"pugi"),
    ("every wait goes through RunLoop", r"src/(?!platform/RunLoop)", r"#include <sys/(epoll|eventfd|timerfd)\.h>"),
    ("only main.cpp asks which host it is", r"src/(?!main\.cpp)", r"TAVISK_HOST"),
    ("handlers print on the stream they are given, and never end the process", CORE,
     r"\bstdout\b|std::c(out|err)\b|std::(printf|puts|putchar|exit|_Exit|quick_exit|abort)\("),
    ("standard error is the front end's", r"src/(settings|startupdisk)/", r"\bstderr\b"),
    ("no shell", r"src/", r"(?<![\w.>])(system|popen)\("),
    ("builds are reproducible", r"src/", r"__(DATE|TIME)__"),
    ("no web addresses in scripts", r"(script|cmake|\.ci)/", r"https?:/"),
    ("the tree explains itself: no word of documents or lists kept elsewhere", r"(?!DEVELOPERS\.md|tests/structure/)",
     r"\b[Ss]pec(ification)?\b(?! *file)|\bParts? \d+\.\d|\b[Ii]ssue #?\d"),
]


def files_of(tree):
    for folder, folders, names in os.walk(tree):
        if "CMakeCache.txt" in names:
            folders.clear()
            continue
        folders[:] = sorted(set(folders) - {".git", ".cache", "build", "dist", "__pycache__"})
        for name in sorted(names):
            yield os.path.relpath(os.path.join(folder, name), tree)


def faults_of(path, lines):
    for rule, paths, pattern in RULES:
        if re.match(paths, path):
            for number, line in enumerate(lines, 1):
                if re.search(pattern, line):
                    yield f"{path}:{number}: {rule}: {line.strip()}"
    if re.match(CODE, path):
        if not (len(lines) > 1 and "SPDX-FileCopyrightText" in lines[0] and "SPDX-License-Identifier" in lines[1]):
            yield f"{path}:1: the two licence lines are missing"
        if len(lines) > LONGEST_SOURCE:
            yield f"{path}: {len(lines)} lines; at most {LONGEST_SOURCE}"


def main(tree):
    faults = []
    for path in files_of(tree):
        with open(os.path.join(tree, path), encoding="utf-8", errors="replace") as file:
            faults += faults_of(path, file.read().splitlines())
    print("\n".join(faults) if faults else "structure: in order")
    return 1 if faults else 0


sys.exit(main(sys.argv[1]))
