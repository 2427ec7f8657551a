# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""A kernel with one static program as its first process: no service manager, no bus, nothing kept but the clock. Of its
network cards only the first can wake it, and its first serial port."""

import pathlib
import shutil
import subprocess

import emulator
import trees

CARDS = {"i82559c": "e100", "vmxnet3": "vmxnet3", "rtl8139": "8139cp", "e1000e": "e1000e", "pcnet": "pcnet32"}  # drivers
WAKING_PORT = pathlib.Path(__file__).with_name("waking-port.asl")
INIT = """#!/bin/busybox sh
/bin/busybox --install -s /bin
mount -t proc proc /proc
mount -t sysfs sysfs /sys
mount -t devtmpfs devtmpfs /dev
modprobe -a """ + " ".join(CARDS.values()) + """
exec sh /agent.sh /dev/ttyS1
"""
FOLDERS = ["bin", "dev", "etc", "lib64", "proc", "run", "sys", "tmp", "usr/lib", "usr/sbin", "usr/share"]
WHOLE = ["usr/share/zoneinfo"]
PROGRAMS = ["usr/sbin/ethtool", "usr/bin/tavisk"]
FILES = ["etc/group", "etc/passwd", *PROGRAMS]


class Guest(emulator.Emulated):
    has = frozenset({"guest", "clock"})
    cannot = "keep files over a restart, run services, reach UEFI firmware"
    reboot = "reboot -f"

    def __init__(self):
        tree = trees.layered("guest-tree", trees.SERVER)
        super().__init__("guest", ["-kernel", trees.boot_file(tree, "vmlinuz-*"), "-initrd", trees.WORK / "guest.cpio",
                                   "-append", "console=ttyS0", "-acpitable", f"file={_compiled(WAKING_PORT)}",
                                   *(word for card in CARDS for word in ("-device", card + ",romfile="))])
        _make_root(tree, self._folder / "root")
        _pack(self._folder / "root", trees.WORK / "guest.cpio")


def _make_root(tree, root):
    for folder in FOLDERS:
        (root / folder).mkdir(parents=True)
    for folder in WHOLE:
        shutil.copytree(tree / folder, root / folder, symlinks=True)
    for file in FILES + _libraries(tree) + _modules(tree):
        (root / file).parent.mkdir(parents=True, exist_ok=True)
        shutil.copy2(tree / file, root / file)
    _unpack_modules(root)
    shutil.copy2(tree / "bin/busybox", root / "bin/busybox")
    shutil.copy2(emulator.AGENT, root / "agent.sh")
    (root / "init").write_text(INIT)
    (root / "init").chmod(0o755)


def _compiled(table):
    trees.run("iasl", "-p", trees.WORK / table.stem, table)
    return trees.WORK / f"{table.stem}.aml"


def _libraries(tree):
    """What the programs are linked with, without the leading slash."""
    words = trees.run("chroot", tree, "ldd", *("/" + program for program in PROGRAMS)).split()
    return [word[1:] for word in words if word.startswith("/") and not word.endswith(":")]


def _modules(tree):
    """The cards' drivers, what they need, and the list that says so."""
    (needs,) = tree.glob("lib/modules/*/modules.dep")
    drivers = tuple(f"/{driver}.ko{packed}" for driver in CARDS.values() for packed in ("", ".xz"))
    lines = [line.split() for line in needs.read_text().splitlines() if line.split(":")[0].endswith(drivers)]
    files = {needs.parent / word.rstrip(":") for line in lines for word in line}
    return [str(file.relative_to(tree)) for file in (needs, *sorted(files))]


def _unpack_modules(root):
    """As they are packed since Debian 13, neither the kernel nor busybox reads them."""
    for module in root.glob("lib/modules/**/*.xz"):
        trees.run("xz", "--decompress", module)
    (needs,) = root.glob("lib/modules/*/modules.dep")
    needs.write_text(needs.read_text().replace(".ko.xz", ".ko"))


def _pack(root, archive):
    names = trees.run("find", ".", cwd=root)
    with open(archive, "wb") as packed:
        subprocess.run(["cpio", "--quiet", "-o", "-H", "newc"], input=names.encode(), stdout=packed, cwd=root, check=True)
