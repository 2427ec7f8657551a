# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""A Debian server with UEFI firmware, disks, a watchdog, a management controller and a clock of its own."""

import shutil

import check
import controller
import emulator
import trees

FIRMWARE = "/usr/share/OVMF/OVMF_CODE_4M.fd"
FIRMWARE_VARIABLES = "/usr/share/OVMF/OVMF_VARS_4M.fd"
CONTROLLER = trees.WORK / "controller"
SECTOR = 512
BOOT_START = 2048            # sectors
BOOT_SIZE = 64 * 1024        # KiB
ROOT_SIZE = 1536 * 1024      # KiB
ROOT_START = BOOT_START * SECTOR + BOOT_SIZE * 1024  # bytes
BOOT_ENTRY = """title Debian
linux /vmlinuz
initrd /initrd
options root=PARTLABEL=root rw console=ttyS0 systemd.log_color=0
"""
# The disks are found late.
WAITS_FOR_DISKS = "ExecStartPre=-timeout 60 sh -c 'until [ -e /sys/block/sdb ]; do sleep 1; done; udevadm settle'\n"
AGENT_UNIT = """[Unit]
Description=Commands of the tests
After=multi-user.target

[Service]
{waits}ExecStart=/bin/sh /usr/lib/agent.sh /dev/ttyS1

[Install]
WantedBy=graphical.target
"""


class Server(emulator.Emulated):
    has = frozenset({"bus", "clock", "server", "systemd-timesyncd"})
    cannot = "sleep and wake, lose its power"
    reboot = "systemctl reboot"

    def __init__(self, kind="server", packages=(), devices=(), own=("tavisk",)):
        """With devices of its own it has none for power settings."""
        self.has |= {trees.COLLECTION} & set(own)
        tree = trees.layered(f"{kind}-tree", [*trees.SERVER, *packages], own=own)
        disk = trees.WORK / f"{kind}.img"
        variables = trees.WORK / f"{kind}-variables.fd"
        super().__init__(kind, [
            "-drive", f"if=pflash,format=raw,readonly=on,file={FIRMWARE}",
            "-drive", f"if=pflash,format=raw,file={variables}", "-drive", f"if=virtio,format=raw,file={disk}",
            *(devices or _power_devices())])
        self._controller = None if devices else controller.Controller(CONTROLLER)
        shutil.copy(FIRMWARE_VARIABLES, variables)
        add_agent(tree, WAITS_FOR_DISKS)
        self.equip(tree)
        _make_disk(tree, disk)

    def equip(self, tree):
        """Puts into the tree what a machine of this kind has besides."""

    def run(self, command):
        order = command.removeprefix(check.REPORTING)
        if order.startswith("controller "):
            return check.Answer(0, self._controller.obey(order), "")
        return super().run(command)


class Rehearsal(Server):
    """What is rehearsed is compared with what is done where there is more to set than in a container."""
    has = own = frozenset({"rehearsal"})

    def __init__(self):
        super().__init__("rehearsal", ["jq", "openssh-server"])


def _power_devices():
    """A disk with a motor and one without, a watchdog, and the way to the controller."""
    devices = ["-device", "i6300esb", "-chardev", f"socket,id=controller,path={CONTROLLER},reconnect=10",
               "-device", "ipmi-bmc-extern,id=bmc,chardev=controller", "-device", "isa-ipmi-kcs,bmc=bmc"]
    for place, turns in enumerate((7200, 1)):
        disk = trees.WORK / f"turning-{turns}.img"
        trees.run("truncate", "-s", "64M", disk)
        devices += ["-drive", f"if=none,id=turning-{turns},format=raw,file={disk}",
                    "-device", f"ide-hd,drive=turning-{turns},bus=ide.{place},rotation_rate={turns}"]
    return devices


def add_agent(tree, waits=""):
    shutil.copy(emulator.AGENT, tree / "usr/lib/agent.sh")
    (tree / "etc/systemd/system/agent.service").write_text(AGENT_UNIT.format(waits=waits))
    trees.run("systemctl", f"--root={tree}", "enable", "agent.service")


def _make_disk(tree, disk):
    trees.run("truncate", "-s", ROOT_START + (ROOT_SIZE + 1024) * 1024, disk)
    trees.run("sgdisk", f"--new=1:{BOOT_START}:+{BOOT_SIZE}K", "--typecode=1:ef00", f"--new=2:0:+{ROOT_SIZE}K",
              "--change-name=2:root", disk)
    trees.run("mkfs.ext4", "-q", "-F", "-d", tree, "-E", f"offset={ROOT_START}", disk, f"{ROOT_SIZE}k")
    trees.run("mkfs.vfat", "-F", "32", "-s", "1", f"--offset={BOOT_START}", disk, BOOT_SIZE)
    _fill_boot_partition(tree, f"{disk}@@{BOOT_START * SECTOR}")


def _fill_boot_partition(tree, partition):
    entry = trees.WORK / "debian.conf"
    entry.write_text(BOOT_ENTRY)
    loader = tree / "usr/lib/systemd/boot/efi/systemd-bootx64.efi"
    trees.run("mmd", "-i", partition, "::/EFI", "::/EFI/BOOT", "::/loader", "::/loader/entries")
    for source, target in ((loader, "EFI/BOOT/BOOTX64.EFI"), (trees.boot_file(tree, "vmlinuz-*"), "vmlinuz"),
                           (trees.boot_file(tree, "initrd.img-*"), "initrd"), (entry, "loader/entries/debian.conf")):
        trees.run("mcopy", "-i", partition, source, "::/" + target)
