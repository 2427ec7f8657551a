#!/bin/sh
# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
#
# tree-hook.sh essential|customize TREE: what a tree needs besides its packages.
set -eu
step=$1
tree=$2

# Only what the emulated server's own disk needs: a large initial file system takes long to unpack there.
essential() {
  mkdir -p "$tree/etc/initramfs-tools/conf.d"
  echo MODULES=list >"$tree/etc/initramfs-tools/conf.d/machine"
  printf '%s\n' virtio_pci virtio_blk ext4 crc32c_generic >"$tree/etc/initramfs-tools/modules"
}

customize() {
  chroot "$tree" groupadd --system admin
  chroot "$tree" useradd --create-home --groups admin alice
  chroot "$tree" useradd --create-home mallory
  echo machine >"$tree/etc/hostname"
}

"$step"
