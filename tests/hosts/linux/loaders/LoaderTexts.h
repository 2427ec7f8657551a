// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include "hosts/linux/loaders/GrubEnvironment.h"
#include "hosts/linux/loaders/LoaderMachine.h"

namespace tavisk {

/// As grub-mkconfig writes its beginning.
inline std::string menu(const std::string& chosen, const std::string& entries) {
  return "if [ -s $prefix/grubenv ]; then\n  set have_grubenv=true\n  load_env\nfi\n"
         "if [ \"${next_entry}\" ] ; then\n   set default=\"${next_entry}\"\n   set next_entry=\n"
         "   save_env next_entry\n   set boot_once=true\nelse\n   set default=\"" +
         chosen +
         "\"\nfi\nif [ x\"${feature_menuentry_id}\" = xy ]; then\n  menuentry_id_option=\"--id\"\nelse\n"
         "  menuentry_id_option=\"\"\nfi\nexport menuentry_id_option\nterminal_output gfxterm\n" +
         entries;
}

inline std::string entry(const std::string& id, const std::string& uuid, const std::string& root,
                         const std::string& kernel = "/boot/vmlinuz") {
  return "menuentry 'Title of " + id + "' --class os $menuentry_id_option '" + id +
         "' {\n  insmod ext2\n  set root='hd0,gpt2'\n  if [ x$feature_platform_search_hint = xy ]; then\n"
         "    search --no-floppy --fs-uuid --set=root --hint-efi=hd0,gpt2 " +
         uuid + "\n  else\n    search --no-floppy --fs-uuid --set=root " + uuid + "\n  fi\n  linux " + kernel +
         " root=" + root + " ro quiet\n  initrd /initrd.img\n}\n";
}

inline std::string advanced(const std::string& inner) {
  return "submenu 'Advanced options' $menuentry_id_option 'advanced' {\n" + inner + "}\n";
}

inline std::string block(const std::string& lines) {
  auto text = "# GRUB Environment Block\n" + lines;
  text.resize(grub::environmentSize, '#');
  return text;
}

inline std::string stub(const std::string& uuid, const std::string& prefix = "/boot/grub") {
  return "search.fs_uuid " + uuid + " root hd0,gpt2\nset prefix=($root)'" + prefix + "'\nconfigfile $prefix/grub.cfg\n";
}

inline std::string textOf(const Result<SystemStart>& start) {
  if (!start) return "(" + describe(start.failure()) + ")";
  return start->root.text + (start->subvolume.empty() ? "" : "/" + start->subvolume);
}

/// "next=sda2 lasting=sda2 once= starts=sda2 sdb2 keeps=sda2:/boot/grub/grubenv"
inline std::string summaryOf(const Result<LoaderReading>& reading) {
  if (!reading) return describe(reading.failure());
  auto text = "next=" + textOf(reading->next) + " lasting=" + textOf(reading->lasting);
  text += " once=" + reading->once.value_or("") + " starts=";
  for (const auto& start : reading->starts) text += textOf(start) + " ";
  if (reading->keeps.kind == LoaderDefault::Kind::variable) text += "keeps=variable";
  if (reading->keeps.kind == LoaderDefault::Kind::environmentBlock)
    text += "keeps=" + reading->keeps.volume.text + ":" + reading->keeps.path;
  return text;
}

inline const std::string first = entry("gnulinux-simple-aaaa", "aaaa", "UUID=aaaa");
inline const std::string second = entry("osprober-gnulinux-simple-cccc", "cccc", "UUID=cccc");
inline const std::string third = entry("osprober-gnulinux-simple-bbbb", "bbbb", "PARTUUID=part-sda3");
inline constexpr const char* debian = "sda1:\\EFI\\debian\\grubx64.efi";
inline constexpr const char* debianCfg = "sda1:/EFI/debian/grub.cfg";
inline constexpr const char* debianEfi = "sda1:/EFI/debian/grubx64.efi";
inline constexpr const char* menuCfg = "sda2:/boot/grub/grub.cfg";
inline constexpr const char* menuEnv = "sda2:/boot/grub/grubenv";

inline LoaderFiles with(LoaderFiles files, const LoaderFiles& more) {
  for (const auto& [place, contents] : more) files.insert_or_assign(place, contents);
  return files;
}

/// Debian with GRUB on sda, and this menu.
inline LoaderFiles grubWith(const std::string& menu, const LoaderFiles& more = {}) {
  return with({{debianEfi, debianGrub()}, {debianCfg, stub("aaaa")}, {menuCfg, menu}}, more);
}

inline constexpr const char* boot = "sda1:\\EFI\\systemd\\systemd-bootx64.efi";

inline std::string conf(const std::string& root, const std::string& kernel = "/vmlinuz") {
  return "title A system\nlinux " + kernel + "\ninitrd /initrd.img\noptions root=" + root + " rw\n";
}

/// A server with systemd-boot and two systems.
inline LoaderFiles bootWith(const LoaderFiles& more) {
  return with({{"sda1:/EFI/systemd/systemd-bootx64.efi", systemdBootProgram()},
               {"sda1:/loader/entries/one.conf", conf("UUID=aaaa")},
               {"sda1:/loader/entries/two.conf", conf("PARTUUID=part-sda3")}},
              more);
}

}  // namespace tavisk
