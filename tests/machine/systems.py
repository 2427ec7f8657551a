# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""Machines with several installed systems, of which one chooses the other and a restart shows who runs."""

import shutil

import check
import choices
import emulator
import installation
import machine
import server
import sweep
import trees
from installation import System

VARIABLES = "/sys/firmware/efi/efivars"
LOADER_DEFAULT = f"{VARIABLES}/LoaderEntryDefault-4a67b082-0a4c-41cf-b6c7-440b29bb8c4f"
OTHER_VARIABLES = f"cd {VARIABLES} && sha256sum $(ls | grep -v -e '^BootOrder-' -e '^LoaderEntryDefault-' -e '^MTC-')"
ORDER = "efibootmgr | sed -n s/BootOrder:.//p"
BLOCK = "/boot/grub/grubenv"
SHIM = r"\EFI\debian\shimx64.efi"


def _pair(first, second):
    """Two systems that differ in all that tells who runs."""
    return (System(first, "12.1", "11111111-1111-4111-8111-111111111111", "a" * 32),
            System(second, "12.2", "22222222-2222-4222-8222-222222222222", "b" * 32))


class Systems(emulator.Emulated):
    cannot = "require signed programs"
    reboot = "systemctl reboot"
    names = ()
    firmware = True
    equip = ""  # at the first start

    def __init__(self, kind):
        self.systems = _pair(*self.names)
        self.disks = []
        folder = trees.WORK / kind
        folder.mkdir()
        self.make_disks(folder)
        firmware = _firmware(folder / "variables.fd") if self.firmware else []
        super().__init__(kind, [*firmware, *(word for disk in self.disks
                                             for word in ("-drive", f"if=virtio,format=raw,file={disk.path}"))])

    def make_disks(self, folder):
        """Puts them into self.disks."""

    def checks(self, running, other):
        """Which show that the one that runs chooses the other."""

    def start(self):
        super().start()
        equipped = self.run(f"set -e\n{self.equip}")
        if equipped.status:
            raise machine.Trouble(equipped.output + equipped.errors)

    def stop(self):
        """Disks are large, and kept in memory."""
        super().stop()
        for disk in self.disks:
            disk.path.unlink()

    def prove(self, results):
        for running, other in (self.systems, self.systems[::-1]):
            results.add(f"{self.name}: {running.label} runs", self._who_runs_instead_of(running))
            check.do_all(self, self.checks(running, other), results, f", {running.label}")
            self.restart()
        results.add(f"{self.name}: {self.systems[0].label} runs again", self._who_runs_instead_of(self.systems[0]))
        results.add(f"{self.name}: killed before each call that changes the choice", self.kill_each())

    def kill_each(self):
        """What was wrong after a kill."""

    def answer(self, command):
        return self.run(command).output.strip()

    def _who_runs_instead_of(self, system):
        expected = f"{system.uuid}\n{system.release}\n{system.machine_id}"
        runs = self.answer("findmnt -no UUID /; . /etc/os-release; echo $VERSION_ID; cat /etc/machine-id")
        return [] if runs == expected else [f"expected {expected!r}", f"runs {runs!r}"]


class Grub(Systems):
    """Two disks with Debian and its own GRUB, and one whose loader starts the second."""
    names = ("First", "Second")
    equip = "\n".join(f"efibootmgr -q -c -d /dev/{disk} -p 1 -L debian -l '{SHIM}'" for disk in ("vdc", "vdb", "vda"))

    def __init__(self):
        super().__init__("systems")

    def make_disks(self, folder):
        for number, system in enumerate(self.systems, 1):
            disk = installation.Disk(folder / f"disk{number}", boot_id=f"AAAA000{number}")
            self.disks.append(disk)
            installation.put_system(disk, system)
            with installation.inside(disk, 2) as root:
                installation.make_menu(root)
            installation.put_grub(disk, system.uuid)
        installation.put_removable(self.disks[0])
        self.disks.append(_third(folder, starts=self.systems[1]))

    def checks(self, running, other):
        disk = "abc"[self.systems.index(other)]
        return choices.of(running.label, other.label, unlisted=["Third"], then={
            choices.FIRST: choices.entry(f"/dev/vd{disk}1", SHIM), choices.ENTRIES: ""})

    def kill_each(self):
        return sweep.kill_each(self, "tavisk -setstartupdisk Second", lambda: self.answer(ORDER),
                               lambda order: self.run(f"efibootmgr -q -o {order}"),
                               lambda: f"{OTHER_VARIABLES}; sha256sum {BLOCK}")


class BootEntries(Systems):
    """Two systems on one disk and their entries on its boot partition, where systemd-boot reads them."""
    names = ("Alpha", "Beta")
    equip = "bootctl --no-pager install"

    def __init__(self):
        super().__init__("boot-entries")

    def make_disks(self, folder):
        disk = installation.Disk(folder / "disk", roots=2, boot_id="BBBB0001")
        self.disks.append(disk)
        for place, system in enumerate(self.systems):
            installation.put_system(disk, system, place)
            installation.put_entry(disk, system)
        disk.copy(installation.tree() / "usr/lib/systemd/boot/efi/systemd-bootx64.efi", to="EFI/BOOT/BOOTX64.EFI")

    def checks(self, running, other):
        return choices.of(running.label, other.label, then={
            f"cat {LOADER_DEFAULT} | tail -c +5 | tr -d '\\0'": installation.entry_name(other),
            "bootctl --no-pager status | sed -n 's/^ *id: //p'": installation.entry_name(other) + "\n",
            choices.FIRST: choices.entry("/dev/vda1", r"\EFI\systemd\systemd-bootx64.efi"), choices.ENTRIES: ""})

    def kill_each(self):
        def restore(_):
            self.run(f"bootctl set-default {installation.entry_name(self.systems[0])}")
        restore(None)
        return sweep.kill_each(self, "tavisk -setstartupdisk Beta",
                               lambda: self.answer(f"{ORDER}; sha256sum {LOADER_DEFAULT}"), restore,
                               lambda: OTHER_VARIABLES, least=2)


class SavedDefault(Systems):
    """Two systems on one disk of a machine without UEFI. The menu of the first has the other too."""
    names = ("Alpha", "Beta")
    cannot = "keep the choice in firmware"
    firmware = False

    def __init__(self):
        super().__init__("saved-default")

    def make_disks(self, folder):
        disk = installation.Disk(folder / "disk", roots=2)
        self.disks.append(disk)
        for place, system in enumerate(self.systems):
            installation.put_system(disk, system, place)
        with installation.inside(disk, 2) as root:
            installation.make_menu(root)
        with installation.inside(disk, 1) as root:
            root.run("grub-install", "--target=i386-pc", root.disk)
            root.run("mount", f"{root.disk}p2", "/mnt")  # os-prober needs FUSE for what is not mounted
            installation.make_menu(root, GRUB_DEFAULT="saved", GRUB_DISABLE_OS_PROBER="false")
            root.run("grub-editenv", BLOCK, "set", "kept=by others")

    def checks(self, running, other):
        """Whose menu it is has the environment block; from the other system it is reached when that is mounted."""
        is_here = running is self.systems[0]
        block = BLOCK if is_here else f"/mnt{BLOCK}"
        return choices.of(running.label, other.label, mount="" if is_here else "mount LABEL=Alpha /mnt; ", then={
            f"grub-editenv {block} list | sed 's/=gnu.*-/=gnu-/; s/=osp.*-/=osp-/'":
                f"kept=by others\nsaved_entry={'osp' if is_here else 'gnu'}-{other.uuid[-12:]}\n",
            f"stat -c %s {block}; umount /mnt": "1024\n"})

    def kill_each(self):
        def restore(_):
            self.run(f"grub-editenv {BLOCK} unset saved_entry")
        restore(None)
        return sweep.kill_each(self, "tavisk -setstartupdisk Beta", lambda: self.answer(f"sha256sum {BLOCK}"), restore,
                               lambda: "ls -la /boot/grub | grep -v grubenv; sha256sum /boot/grub/grub.cfg", least=2)


def _firmware(variables):
    shutil.copy(server.FIRMWARE_VARIABLES, variables)
    return ["-drive", f"if=pflash,format=raw,readonly=on,file={server.FIRMWARE}",
            "-drive", f"if=pflash,format=raw,file={variables}"]


def _third(folder, starts):
    """It has all that a system has, but its loader goes by the menu of another volume."""
    disk = installation.Disk(folder / "disk3", root_size=64, boot_id="AAAA0003")
    root = folder / "Third"
    for part in ("etc", "boot"):
        (root / part).mkdir(parents=True)
    shutil.copy(installation.tree() / "usr/lib/os-release", root / "etc/os-release")
    shutil.copy(trees.boot_file(installation.tree(), "vmlinuz-*"), root / "boot")
    trees.run("mkfs.ext4", "-q", "-F", "-L", "Third", "-d", root, folder / "Third.img", "64M")
    disk.put_root(folder / "Third.img")
    installation.put_grub(disk, starts.uuid)
    return disk
