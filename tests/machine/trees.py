# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""Debian trees: made once for a list of packages, cached, and laid under a layer of its own for each run."""

import hashlib
import os
import pathlib
import re
import shutil
import subprocess

SUITE = "bookworm"
COMMON = ["dbus", "libblkid1", "libedit2", "libpam-systemd", "login", "polkitd", "procps", "systemd",
          "systemd-sysv", "tzdata"]
SERVER = ["busybox-static", "ethtool", "initramfs-tools", "kmod", "linux-image-amd64", "systemd-boot-efi", "systemd-timesyncd",
          "udev", "zstd"]
HOOK = pathlib.Path(__file__).with_name("tree-hook.sh")
CACHE = pathlib.Path(os.environ.get("TAVISK_CACHE", "/var/cache/tavisk"))
WORK = CACHE / "work"


def run(*command, **options):
    """Runs a program to its end, quietly; CalledProcessError holds what it printed."""
    return subprocess.run([str(word) for word in command], check=True, text=True, stdin=subprocess.DEVNULL,
                          stdout=subprocess.PIPE, stderr=subprocess.STDOUT, **options).stdout


def prepare_work():
    """A folder in memory that only this run sees, and that ends with it."""
    WORK.mkdir(parents=True, exist_ok=True)
    run("mount", "-t", "tmpfs", "-o", "mode=700", "tmpfs", WORK)


def _apt_sources():
    """Where this machine has its own Debian packages from."""
    named = re.compile(rf"(^|\s){SUITE}(\s|$)", re.MULTILINE)
    files = [pathlib.Path("/etc/apt/sources.list"), *sorted(pathlib.Path("/etc/apt/sources.list.d").glob("*"))]
    return [file for file in files if file.suffix in (".list", ".sources") and file.exists()
            and named.search(file.read_text())]


def _cached(packages):
    """The clean tree with these packages."""
    words = sorted(COMMON + packages)
    key = hashlib.sha256(" ".join([SUITE, *words, HOOK.read_text()]).encode()).hexdigest()[:16]
    tree = CACHE / f"tree-{key}"
    if not tree.exists():
        print(f"making a tree with {' '.join(packages)}", flush=True)
        unfinished = CACHE / f"unfinished-{key}"
        shutil.rmtree(unfinished, ignore_errors=True)
        run("mmdebstrap", "--variant=minbase", "--mode=root", "--include=" + ",".join(words), "--format=directory",
            f'--essential-hook={HOOK} essential "$1"', f'--customize-hook={HOOK} customize "$1"', SUITE, unfinished,
            *_apt_sources())
        unfinished.rename(tree)
    return tree


def layered(name, packages):
    """A tree with these packages and the program installed, to be changed at will."""
    clean = _cached(packages)
    layer = WORK / name
    for part in ("upper", "work", "tree"):
        (layer / part).mkdir(parents=True)
    run("mount", "-t", "overlay", "-o", f"lowerdir={clean},upperdir={layer}/upper,workdir={layer}/work", "overlay",
        layer / "tree")
    install_package(layer / "tree")
    return layer / "tree"


def install_package(tree):
    """And beside it the test that comes with the package's sources."""
    (package,) = pathlib.Path("dist").glob("tavisk_*.deb")
    shutil.copy(package, tree / "root/tavisk.deb")
    shutil.copy("debian/tests/smoke", tree / "root/smoke-test")
    run("chroot", tree, "dpkg", "--install", "/root/tavisk.deb",
        env={**os.environ, "PATH": "/usr/sbin:/usr/bin:/sbin:/bin"})


def boot_file(tree, pattern):
    (file,) = (tree / "boot").glob(pattern)
    return file
