# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""Volumes with systems on them, as the server's kernel and device manager report them."""

from check import Check

NEEDS = frozenset({"server"})
FOLDER = "/System/Library/CoreServices"
# A system as the server's firmware would start it, on the volume that is mounted there.
INSTALL = f"""install_system() {{
  mkdir -p "$1{FOLDER}"
  touch "$1{FOLDER}/boot.efi" "$1/mach_kernel"
}}
"""
# A disk that the kernel makes in its memory and that can be pulled like any other.
PLUG = """plug() {
  modprobe scsi_debug dev_size_mb=16
  udevadm settle
  disk=$(lsblk -d -n -o NAME,MODEL | awk '$2 == "scsi_debug" { print $1 }')
  mkfs.ext4 -q -L Backup "/dev/$disk"
  mkdir -p /Volumes/Backup
  mount "/dev/$disk" /Volumes/Backup
  install_system /Volumes/Backup
}
pull() { echo 1 >"/sys/block/$disk/device/delete"; }
tidy() {
  umount -l /Volumes/Backup
  timeout 30 sh -c 'until rmmod scsi_debug 2>/dev/null; do sleep 0.2; done'
}
"""
# Types a line at the prompt and shows the folders that it answers.
PROMPT = """rm -f /run/lines /run/answers
mkfifo /run/lines
tavisk </run/lines >/run/answers &
exec 3>/run/lines
answered() { [ "$(stat -c %s /run/answers)" -gt "$1" ] && [ "$(tail -c 2 /run/answers)" = "> " ]; }
type_line() {
  before=$(stat -c %s /run/answers)
  echo "$1" >&3
  for attempt in $(seq 300); do ! answered "$before" || break; sleep 0.1; done
  tail -c +$((before + 1)) /run/answers | sed -n 's/^> //; /^\\//p'
}
for attempt in $(seq 300); do ! answered 0 || break; sleep 0.1; done
"""

CHECKS = [
    Check("a volume at /Volumes and the root volume are listed, an image is not", needs=NEEDS,
          do=INSTALL + PLUG + f"""plug
install_system ""
truncate -s 16M /run/image
mkfs.ext4 -q /run/image
mkdir -p /Volumes/Image
mount -o loop /run/image /Volumes/Image
install_system /Volumes/Image
tavisk -liststartupdisks | sort
umount /Volumes/Image
rm -r /System /mach_kernel /run/image
tidy""", prints=f"{FOLDER}\n/Volumes/Backup{FOLDER}\n", errors=""),
    Check("a disk is listed two lines after it was plugged in, and gone two lines after it was pulled", needs=NEEDS,
          do=INSTALL + PLUG + PROMPT + """type_line -liststartupdisks
plug
type_line ""
type_line ""
echo plugged in
type_line -liststartupdisks
pull
type_line ""
type_line ""
echo pulled
type_line -liststartupdisks
exec 3>&-
wait
tidy""", prints=f"plugged in\n/Volumes/Backup{FOLDER}\npulled\n"),
]
