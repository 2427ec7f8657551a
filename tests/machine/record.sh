#!/bin/sh
# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
#
# record.sh: what this machine's files say of its disks, network cards, serial ports and management controller, a line
# each: PATH -> TARGET, PATH = VALUE (none for what cannot be read), and "wake CARD MODES NOW" in the letters of ethtool. Tests make a tree of it.
link() { if [ -L "$1" ]; then echo "$1 -> $(readlink "$1")"; fi; }
value() { if [ -f "$1" ] && text=$(head -n 1 "$1" 2>/dev/null); then echo "$1 = $text"; fi; }
modes() { ethtool "$1" 2>/dev/null | sed -n "s/^.$2: //p"; }

ancestors() {
  above=$1
  while [ "$above" != /sys/devices ] && [ -n "$above" ]; do
    link "$above/subsystem"
    value "$above/power/wakeup"
    above=${above%/*}
  done
}

devices() {
  for device in /sys/block/sd* /sys/class/net/eth* /sys/class/tty/ttyS[01] /sys/class/ipmi/*; do
    [ -e "$device" ] || continue
    link "$device"
    here=$(readlink -f "$device")
    link "$here/device"
    for name in removable queue/rotational ifindex power/wakeup; do value "$here/$name"; done
    parent=$(readlink -f "$here/device")
    ancestors "$parent"
    for file in "$parent"/type "$parent"/power/control "$parent"/power/autosuspend_delay_ms \
      "$parent"/scsi_disk/*/manage_*start_stop; do value "$file"; done
  done
}

cards() {
  for card in /sys/class/net/eth*; do
    [ ! -e "$card" ] || echo "wake ${card##*/} $(modes "${card##*/}" "Supports Wake-on") $(modes "${card##*/}" Wake-on)"
  done
}

{ devices; cards; } | sort -u
