# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""A server with disks of all kinds. Its systems start small programs that say on the console whose they are."""

import pathlib
import re
import socket
import subprocess

import machine
import server
import sweep
import trees

PROGRAM = pathlib.Path(__file__).with_name("boot_program.c")
CORE = "System/Library/CoreServices"
PROJECTS_UUID = "0f1e2d3c-4b5a-6978-8796-a5b4c3d2e1f0"
START = 2048        # sectors of the first partition
SIZE = 16 * 1024    # KiB of each
STEP = SIZE * 2     # sectors
# Which volume is where: mount point, label, type.
MOUNTS = [("/boot/projects", "STARTER", "vfat"), ("/Volumes/Projects", "Projects", "ext4"),
          ("/Volumes/Archive", "Archive", "ext4"), ("/Volumes/Backup", "BACKUP", "vfat"),
          ("/Volumes/Empty", "EMPTY", "vfat"), ("/Volumes/Stick", "STICK", "vfat"),
          ("/Volumes/Disc", "DISC", "iso9660"), ("/Volumes/Data Disc", "DATA", "iso9660")]


class Startup(server.Server):
    has = own = frozenset({"startup"})
    cannot = "require signed programs, lose its power"

    def __init__(self):
        self._monitor_path = trees.WORK / "startup-monitor"
        devices = _devices(trees.WORK / "startup-disks", self._monitor_path)
        super().__init__("startup", ["e2fsprogs", "efibootmgr", "strace"], devices)

    def equip(self, tree):
        lines = [f"LABEL={label} {point.replace(' ', chr(92) + '040')} {kind} nofail,X-mount.mkdir 0 0\n"
                 for point, label, kind in MOUNTS]
        (tree / "etc/fstab").write_text("".join(lines))
        _make_disks(trees.WORK / "startup-disks")

    def start(self):
        """The emulated machine finds its disks so slowly that the service manager may have given them up."""
        super().start()
        found = "udevadm settle --timeout=60 && mount -a"
        machine.wait_until(lambda: self.run(found).status == 0, 200, "the volumes")

    def restart(self):
        """By power: the firmware of this emulator is seen to hang when a machine with such disks restarts warm."""
        self._send("systemctl poweroff")
        self._process.wait(120)
        self.start()

    def prove_more(self, results):
        console = pathlib.Path(self._folder / "console.log").read_text(errors="replace")
        results.add("startup: firmware started the chosen volume's own file", _wrong_starts(console))
        results.add("startup: a disk plugged in and pulled at the prompt", self._plug_and_pull())
        results.add("startup: killed before each call that changes a file", sweep.faults(self))

    def _plug_and_pull(self):
        self.run("mkfifo /run/lines; sleep 1000000 >/run/lines & tavisk </run/lines >>/run/answers 2>&1 &")
        seen = [self._listed_at_prompt()]
        self._monitor("device_add usb-storage,id=plugged,drive=plugged,bus=usb.0")
        machine.wait_until(lambda: self.run("test -e /dev/disk/by-label/PLUGGED").status == 0, 200, "the plugged disk")
        self.run("mkdir -p /Volumes/Plugged; mount /dev/disk/by-label/PLUGGED /Volumes/Plugged")
        seen += [self._listed_at_prompt() for _ in range(3)]
        self._monitor("device_del plugged")
        machine.wait_until(lambda: self.run("test -e /dev/disk/by-label/PLUGGED").status != 0, 200, "the pull")
        seen += [self._listed_at_prompt() for _ in range(3)]
        others, plugged = seen[0], seen[0] | {f"/Volumes/Plugged/{CORE}"}
        correct = plugged == seen[3] != others == seen[6] and all(folders in (others, plugged) for folders in seen)
        return [] if correct else [repr(folders) for folders in seen]

    def _listed_at_prompt(self):
        self.run(": >/run/answers; echo -liststartupdisks >/run/lines")
        answer = machine.wait_until(lambda: self.run("tail -c 2 /run/answers | grep -q '> ' && cat /run/answers").output, 200,
                                    "the prompt's answer")
        return {line for line in answer.splitlines() if line.startswith("/")}

    def _monitor(self, command):
        with socket.socket(socket.AF_UNIX) as monitor:
            monitor.connect(str(self._monitor_path))
            monitor.settimeout(60)
            _read_to_prompt(monitor)
            monitor.sendall(command.encode() + b"\n")
            answer = _read_to_prompt(monitor)
        if "Error" in answer:
            raise machine.Trouble(answer[answer.index("Error"):])


def _read_to_prompt(monitor):
    """Whoever hangs up before the next prompt may not have been heard."""
    said = b""
    while not said.endswith(b"(qemu) "):
        part = monitor.recv(4096)
        if not part:
            raise machine.Trouble("the emulator's monitor hung up")
        said += part
    return said.decode(errors="replace")


def _wrong_starts(console):
    """Each of the programs gives the turn to the entry that was first before it."""
    started = re.findall(r"test: started from (\w+)", console)
    return [] if started == ["Backup", "Stick", "Projects"] else [f"started from {started}", console[-1000:]]


def _devices(folder, monitor):
    drives = [("gpt", "ide-hd,bus=ide.0", "disk"), ("mbr", "ide-hd,bus=ide.1", "disk"),
              ("stick", "usb-storage,bus=usb.0,removable=on", "disk"), ("disc", "ide-cd,bus=ide.2", "cdrom"),
              ("data", "ide-cd,bus=ide.3", "cdrom")]
    words = ["-device", "qemu-xhci,id=usb", "-monitor", f"unix:{monitor},server=on,wait=off",
             "-drive", f"if=none,id=plugged,format=raw,file={folder}/plugged"]
    for name, device, media in drives:
        words += ["-drive", f"if=none,id={name},format=raw,media={media},file={folder}/{name}",
                  "-device", f"{device},drive={name}"]
    return words


def _make_disks(folder):
    folder.mkdir()
    disk = _gpt_disk(folder / "gpt", ["ef00", "8300", "8300"])
    beside = folder / "beside" / "EFI/tavisk" / PROJECTS_UUID
    beside.mkdir(parents=True)
    _build_program("Projects", beside / "boot.efi")
    _fat(disk, 0, "STARTER", folder / "beside" / "EFI")
    _ext4(disk, 1, "Projects", _system(folder, "Projects"), PROJECTS_UUID)
    _ext4(disk, 2, "Archive", _system(folder, "Archive"), "random")
    disk = _mbr_disk(folder / "mbr", 2)
    _fat(disk, 0, "BACKUP", *_system(folder, "Backup").iterdir())
    _fat(disk, 1, "EMPTY")
    _fat(_gpt_disk(folder / "stick", ["0700"]), 0, "STICK", *_system(folder, "Stick").iterdir())
    _fat(_gpt_disk(folder / "plugged", ["0700"]), 0, "PLUGGED", *_system(folder, "Plugged").iterdir())
    _disc(folder / "data", "DATA", _system(folder, "Data"))
    trees.run("mkfs.vfat", "-C", folder / "empty.img", 1024)
    contents = _system(folder, "Disc")
    (folder / "empty.img").rename(contents / "start.img")
    _disc(folder / "disc", "DISC", contents, "-e", "start.img", "-no-emul-boot")


def _system(folder, volume):
    contents = folder / volume
    (contents / CORE).mkdir(parents=True)
    _build_program(volume, contents / CORE / "boot.efi")
    (contents / "mach_kernel").write_text("a kernel\n")
    return contents


def _build_program(volume, path):
    compiled = path.with_suffix(".o")
    trees.run("gcc", "-c", "-O1", "-ffreestanding", "-fno-ident", "-fno-stack-protector", "-fshort-wchar",
              "-mno-red-zone", "-fno-asynchronous-unwind-tables", "-fpie", f'-DNAME=L"{volume}"', PROGRAM,
              "-o", compiled)
    trees.run("ld", "-m", "i386pep", "--subsystem", "10", "-e", "start", "-s", "-o", path, compiled)
    compiled.unlink()


def _empty_disk(disk, partitions):
    trees.run("truncate", "-s", (START + (partitions + 1) * STEP) * server.SECTOR, disk)
    return disk


def _gpt_disk(disk, types):
    _empty_disk(disk, len(types))
    for number, kind in enumerate(types, 1):
        start = START + (number - 1) * STEP
        trees.run("sgdisk", f"--new={number}:{start}:+{SIZE}K", f"--typecode={number}:{kind}", disk)
    return disk


def _mbr_disk(disk, partitions):
    lines = ["label: dos", "label-id: 0x1badd00d"]
    lines += [f"start={START + number * STEP}, size={STEP}, type=c" for number in range(partitions)]
    subprocess.run(["sfdisk", "--quiet", _empty_disk(disk, partitions)], input="\n".join(lines), text=True, check=True)
    return disk


def _fat(disk, partition, label, *contents):
    start = START + partition * STEP
    trees.run("mkfs.vfat", "-n", label, f"--offset={start}", disk, SIZE)
    if contents:
        trees.run("mcopy", "-s", "-i", f"{disk}@@{start * server.SECTOR}", *contents, "::/")


def _ext4(disk, partition, label, contents, uuid):
    offset = (START + partition * STEP) * server.SECTOR
    trees.run("mkfs.ext4", "-q", "-F", "-L", label, "-U", uuid, "-d", contents, "-E", f"offset={offset}", disk,
              f"{SIZE}k")


def _disc(image, label, contents, *options):
    trees.run("xorriso", "-as", "mkisofs", "-quiet", "-R", "-V", label, *options, "-o", image, contents)
