# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""A kernel with one static program as its first process: no service manager, no bus, nothing kept but the clock."""

import shutil
import subprocess

import emulator
import trees

INIT = """#!/bin/busybox sh
/bin/busybox --install -s /bin
mount -t proc proc /proc
mount -t sysfs sysfs /sys
mount -t devtmpfs devtmpfs /dev
exec sh /agent.sh /dev/ttyS1
"""
FOLDERS = ["bin", "dev", "etc", "lib64", "proc", "run", "sys", "tmp", "usr/lib", "usr/sbin", "usr/share"]
WHOLE = ["usr/share/zoneinfo"]
FILES = ["etc/group", "etc/passwd", "usr/sbin/tavisk"]


class Guest(emulator.Emulated):
    has = frozenset({"guest", "clock"})
    cannot = "keep files over a restart, run services, reach UEFI firmware"
    reboot = "reboot -f"

    def __init__(self):
        tree = trees.layered("guest-tree", trees.SERVER)
        super().__init__("guest", ["-kernel", trees.kernel(tree), "-initrd", trees.WORK / "guest.cpio",
                                   "-append", "console=ttyS0"])
        _make_root(tree, self._folder / "root")
        _pack(self._folder / "root", trees.WORK / "guest.cpio")


def _make_root(tree, root):
    for folder in FOLDERS:
        (root / folder).mkdir(parents=True)
    for folder in WHOLE:
        shutil.copytree(tree / folder, root / folder, symlinks=True)
    for file in FILES + _libraries(tree):
        (root / file).parent.mkdir(parents=True, exist_ok=True)
        shutil.copy2(tree / file, root / file)
    shutil.copy2(tree / "bin/busybox", root / "bin/busybox")
    shutil.copy2(emulator.AGENT, root / "agent.sh")
    (root / "init").write_text(INIT)
    (root / "init").chmod(0o755)


def _libraries(tree):
    """What the program is linked with, without the leading slash."""
    words = trees.run("chroot", tree, "ldd", "/usr/sbin/tavisk").split()
    return [word[1:] for word in words if word.startswith("/")]


def _pack(root, archive):
    names = trees.run("find", ".", cwd=root)
    with open(archive, "wb") as packed:
        subprocess.run(["cpio", "--quiet", "-o", "-H", "newc"], input=names.encode(), stdout=packed, cwd=root, check=True)
