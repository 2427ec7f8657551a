# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""Disks with Debian systems on them, as installers leave them."""

import contextlib
import dataclasses
import functools
import pathlib
import re
import shutil
import subprocess
import types

import server
import trees

PACKAGES = [*trees.SERVER, "efibootmgr", "grub-efi-amd64-signed", "grub-pc-bin", "os-prober", "shim-signed", "strace",
            "systemd-boot"]
DRIVERS = {"block", "virtio"}  # the others are left out of the roots, which are copied often
UNNEEDED = ["apt-daily.timer", "apt-daily-upgrade.timer", "e2scrub_reap.service", "getty@tty1.service",
            "serial-getty@ttyS0.service", "systemd-timesyncd.service"]  # they lengthen each start
MIB = 1024 * 1024
START = 2048                   # sectors
BOOT_SIZE = 64                 # MiB
ROOT_SIZE = 768                # MiB
KERNEL_WORDS = "console=ttyS0 systemd.log_color=0"
GRUB_SETTINGS = {"GRUB_TIMEOUT": "0", "GRUB_CMDLINE_LINUX_DEFAULT": '""', "GRUB_CMDLINE_LINUX": f'"{KERNEL_WORDS}"',
                 "#GRUB_TERMINAL": "console"}
NODES = [("null", "c", 1, 3), ("zero", "c", 1, 5), ("urandom", "c", 1, 9)]
PATH = {"PATH": "/usr/sbin:/usr/bin:/sbin:/bin", "LC_ALL": "C"}


@dataclasses.dataclass(frozen=True)
class System:
    """What tells one from the other: the label of its root, and what it says of itself."""
    label: str
    release: str
    uuid: str
    machine_id: str

    def fstab(self, boot_partition):
        boot = f"UUID={boot_partition[:4]}-{boot_partition[4:]} /boot/efi vfat umask=0077 0 0\n" if boot_partition else ""
        return f"UUID={self.uuid} / ext4 errors=remount-ro 0 0\n{boot}"


class Disk:
    """An empty disk: with UEFI one for its boot partition, which has the number 1, and roots."""

    def __init__(self, path, roots=1, root_size=ROOT_SIZE, boot_id=""):
        self.path, self.boot_id = path, boot_id
        self._roots = START + (BOOT_SIZE * MIB // server.SECTOR if boot_id else 0)
        self._step = root_size * MIB // server.SECTOR
        trees.run("truncate", "-s", (self._roots + roots * self._step) * server.SECTOR + MIB, path)
        if boot_id:
            self._make_gpt(roots, root_size)
        else:
            self._make_mbr(roots)

    def _make_gpt(self, roots, root_size):
        words = ["--set-alignment=1", f"--new=1:{START}:+{BOOT_SIZE}M", "--typecode=1:ef00"]
        words += [f"--new={number}:0:+{root_size}M" for number in range(2, 2 + roots)]
        trees.run("sgdisk", *words, self.path)
        trees.run("mkfs.vfat", "-F", "32", "-s", "1", "-i", self.boot_id, f"--offset={START}", self.path, BOOT_SIZE * 1024)

    def _make_mbr(self, roots):
        lines = ["label: dos", *(f"start={START + number * self._step}, size={self._step}, type=83" for number in range(roots))]
        subprocess.run(["sfdisk", "--quiet", self.path], input="\n".join(lines), text=True, check=True)

    def put_root(self, image, place=0):
        start = (self._roots + place * self._step) * server.SECTOR
        trees.run("dd", f"if={image}", f"of={self.path}", "bs=1M", "conv=notrunc,sparse", "oflag=seek_bytes", f"seek={start}")

    def copy(self, *sources, to):
        """Files onto the boot partition."""
        partition = f"{self.path}@@{START * server.SECTOR}"
        folder = pathlib.PurePath("/")
        for part in pathlib.PurePath(to).parent.parts:
            folder /= part
            subprocess.run(["mmd", "-D", "s", "-i", partition, f"::{folder}"], stdin=subprocess.DEVNULL, check=False,
                           stdout=subprocess.DEVNULL, stderr=subprocess.DEVNULL)
        for source in sources:
            trees.run("mcopy", "-i", partition, source, f"::/{to}")


@functools.cache
def tree():
    """With the package installed."""
    made = trees.layered("systems-tree", PACKAGES)
    server.add_agent(made)
    shutil.copy(pathlib.Path(__file__).with_name("in-time.sh"), made / "usr/lib/in-time.sh")
    trees.run("systemctl", f"--root={made}", "mask", *UNNEEDED)
    (kernel,) = (made / "usr/lib/modules").glob("*/kernel")
    for folder in (kernel / "sound", *(kernel / "drivers").iterdir()):
        if folder.name not in DRIVERS:
            shutil.rmtree(folder)
    trees.run("chroot", made, "depmod", kernel.parent.name)
    (made / "boot/efi").mkdir()
    return made


@functools.cache
def root_image():
    image = trees.WORK / "systems-root"
    trees.run("mkfs.ext4", "-q", "-F", "-d", tree(), image, f"{ROOT_SIZE}M")
    return image


def _node(path, kind, major, minor):
    trees.run("mknod", path, kind, major, minor)


def _make_nodes(devices, loop, partitions):
    """Only what belongs to this disk: GRUB's programs look through all disks that they find."""
    trees.run("mount", "-t", "tmpfs", "tmpfs", devices)
    for name, *numbers in NODES:
        _node(devices / name, *numbers)
    names = devices / "disk/by-uuid"
    names.mkdir(parents=True)
    for name in [pathlib.Path(loop).name, *(pathlib.Path(partition).name for partition in partitions)]:
        numbers = pathlib.Path(f"/sys/class/block/{name}/dev").read_text().strip().split(":")
        _node(devices / name, "b", *numbers)
    for partition in partitions:
        uuid = trees.run("blkid", "-p", "-o", "value", "-s", "UUID", partition).strip()
        if uuid:  # not an empty one
            (names / uuid).symlink_to(f"../../{pathlib.Path(partition).name}")


@contextlib.contextmanager
def _attached(disk):
    """The loop device of the disk, and its partitions. What is still mounted of it keeps it until that ends."""
    loop = trees.run("losetup", "--partscan", "--find", "--show", disk.path).strip()
    try:
        trees.run("partx", "--update", loop)
        yield loop, sorted(map(str, pathlib.Path("/dev").glob(f"{pathlib.Path(loop).name}p*")))
    finally:
        trees.run("losetup", "--detach", loop)


@contextlib.contextmanager
def inside(disk, number):
    """A system on the partition of that number: its folder, its disk, and a function that runs commands in it."""
    folder = trees.WORK / "installing"
    folder.mkdir(exist_ok=True)
    with _attached(disk) as (loop, partitions):
        trees.run("mount", f"{loop}p{number}", folder)
        try:
            _make_nodes(folder / "dev", loop, partitions)
            trees.run("mount", "-t", "proc", "proc", folder / "proc")
            trees.run("mount", "--bind", "/sys", folder / "sys")
            yield types.SimpleNamespace(folder=folder, disk=loop,
                                        run=lambda *words: trees.run("chroot", folder, *words, env=PATH))
        finally:
            trees.run("umount", "--recursive", folder)


def put_system(disk, system, place=0):
    """A root with this system, which no loader starts yet."""
    image = trees.WORK / "system"
    trees.run("cp", "--sparse=always", root_image(), image)
    trees.run("tune2fs", "-L", system.label, "-U", system.uuid, image)
    disk.put_root(image, place)
    image.unlink()
    with inside(disk, place + (2 if disk.boot_id else 1)) as root:
        (root.folder / "etc/machine-id").write_text(system.machine_id + "\n")
        (root.folder / "etc/fstab").write_text(system.fstab(disk.boot_id))
        release = root.folder / "usr/lib/os-release"
        release.write_text(re.sub('(?m)^VERSION_ID=.*', f'VERSION_ID="{system.release}"', release.read_text()))


def make_menu(root, **settings):
    """What the package of GRUB does after it was configured, and the part of grub-install that is done on the root."""
    text = (root.folder / "usr/share/grub/default/grub").read_text()
    for name, value in {**GRUB_SETTINGS, **settings}.items():
        text = re.sub(f"(?m)^{name}=.*", f"{name.lstrip('#')}={value}", text)
    (root.folder / "etc/default/grub").write_text(text)
    root.run("mkdir", "-p", "/boot/grub")
    root.run("sh", "-c", "[ -e /boot/grub/grubenv ] || grub-editenv /boot/grub/grubenv create")
    root.run("update-grub")


def put_grub(disk, starts):
    """The signed loaders as grub-install puts them, with the configuration that leads to the root with that UUID."""
    signed = {"shimx64.efi": "shim/shimx64.efi.signed", "grubx64.efi": "grub/x86_64-efi-signed/grubx64.efi.signed",
              "mmx64.efi": "shim/mmx64.efi.signed", "fbx64.efi": "shim/fbx64.efi.signed", "BOOTX64.CSV": "shim/BOOTX64.CSV"}
    for name, source in signed.items():
        disk.copy(tree() / "usr/lib" / source, to=f"EFI/debian/{name}")
    stub = trees.WORK / "grub.cfg"
    stub.write_text(f"search.fs_uuid {starts} root hd0,gpt2 \nset prefix=($root)'/boot/grub'\nconfigfile $prefix/grub.cfg\n")
    disk.copy(stub, to="EFI/debian/grub.cfg")


def put_removable(disk):
    """What firmware starts that knows of no entry yet (grub-install --force-extra-removable)."""
    disk.copy(tree() / "usr/lib/shim/shimx64.efi.signed", to="EFI/BOOT/BOOTX64.EFI")
    disk.copy(tree() / "usr/lib/grub/x86_64-efi-signed/grubx64.efi.signed", to="EFI/BOOT/grubx64.efi")


def entry_name(system):
    return f"{system.machine_id}-{kernel_version()}.conf"


def kernel_version():
    return trees.boot_file(tree(), "vmlinuz-*").name.removeprefix("vmlinuz-")


def put_entry(disk, system):
    """The kernel and its entry as kernel-install puts them."""
    folder = f"{system.machine_id}/{kernel_version()}"
    disk.copy(trees.boot_file(tree(), "vmlinuz-*"), to=f"{folder}/linux")
    disk.copy(trees.boot_file(tree(), "initrd.img-*"), to=f"{folder}/initrd.img-{kernel_version()}")
    entry = trees.WORK / "entry.conf"
    entry.write_text(f"""# Boot loader entry of type 1
title      Debian GNU/Linux 12 (bookworm)
version    {kernel_version()}
machine-id {system.machine_id}
sort-key   debian
options    root=UUID={system.uuid} ro {KERNEL_WORDS} systemd.machine_id={system.machine_id}
linux      /{folder}/linux
initrd     /{folder}/initrd.img-{kernel_version()}
""")
    disk.copy(entry, to=f"loader/entries/{entry_name(system)}")
