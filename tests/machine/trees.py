# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""Debian trees: made once for a list of packages, cached, and laid under a layer of its own for each run."""

import os
import pathlib
import platform
import shutil
import subprocess

RELEASE = os.environ["TAVISK_RELEASE"]
OWN_RELEASE = platform.freedesktop_os_release()["VERSION_CODENAME"]
COMMON = ["dbus", "libblkid1", "libedit2", "libpam-systemd", "login", "polkitd", "procps", "systemd",
          "systemd-sysv", "tzdata"]
SERVER = ["busybox-static", "ethtool", "initramfs-tools", "kmod", "linux-image-amd64", "systemd-boot-efi", "systemd-timesyncd",
          "udev", "zstd"]
HOOK = pathlib.Path(__file__).with_name("tree-hook.sh")
COLLECTION = "ansible-collection-tavisk-settings"
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


def _cached(release, packages):
    """The clean tree with these packages; where it is made, that is told."""
    made = subprocess.run(["script/tree", "--hook", HOOK, release, "amd64", *COMMON, *packages], check=True, text=True,
                          stdin=subprocess.DEVNULL, stdout=subprocess.PIPE)
    return pathlib.Path(made.stdout.strip())


def layered(name, packages, release=RELEASE, own=("tavisk",)):
    """A tree with these packages and those of our own installed, to be changed at will."""
    clean = _cached(release, packages)
    layer = WORK / name
    for part in ("upper", "work", "tree"):
        (layer / part).mkdir(parents=True)
    run("mount", "-t", "overlay", "-o", f"lowerdir={clean},upperdir={layer}/upper,workdir={layer}/work", "overlay",
        layer / "tree")
    install_packages(layer / "tree", release, own)
    return layer / "tree"


def package(release=RELEASE, name="tavisk"):
    """The file, which script/test-machine has made."""
    (package,) = pathlib.Path("dist" if release == OWN_RELEASE else f"dist/{release}").glob(f"{name}_*.deb")
    return package


def install_packages(tree, release, own):
    """And beside them the test that comes with the package's sources."""
    for name in own:
        shutil.copy(package(release, name), tree / f"root/{name}.deb")
    shutil.copy("debian/tests/smoke", tree / "root/smoke-test")
    run("chroot", tree, "dpkg", "--install", *(f"/root/{name}.deb" for name in own),
        env={**os.environ, "PATH": "/usr/sbin:/usr/bin:/sbin:/bin"})


def boot_file(tree, pattern):
    (file,) = (tree / "boot").glob(pattern)
    return file
