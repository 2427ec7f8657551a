// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <string>

#include "base/Path.h"
#include "hosts/linux/LinuxTree.h"

namespace tavisk {

/// Runs a program of this machine; what it prints is dropped. False when it fails or is missing.
inline bool runTool(const std::string& commandLine) {
  return std::system(("PATH=/usr/sbin:/usr/bin:/sbin:/bin; (" + commandLine + ") >/dev/null 2>&1").c_str()) == 0;
}

/// A Linux machine made of files that has disks: what sysfs and the mount table say of them, and images for nodes.
class DiskTree : public LinuxTree {
 public:
  static constexpr const char* sata = "/devices/pci0000:00/0000:00:1f.2/ata1/host0/target0:0:0/0:0:0:0";

  static constexpr const char* usb = "/devices/pci0000:00/0000:00:14.0/usb1/1-2/1-2:1.0/host4/target4:0:0/4:0:0:0";
  /// What the device manager knows of a drive with such a disc in it.
  static constexpr const char* bootableDvd =
      "E:ID_CDROM=1\nE:ID_CDROM_DVD=1\nE:ID_CDROM_MEDIA=1\nE:ID_CDROM_MEDIA_DVD_PLUS_R=1\nE:ID_FS_TYPE=iso9660\n"
      "E:ID_FS_USAGE=filesystem\nE:ID_FS_BOOT_SYSTEM_ID=EL\\x20TORITO\\x20SPECIFICATION\n";

  /// A whole disk that hangs on a device, with its size in units of 512 bytes.
  void addDisk(const std::string& name, const std::string& number, std::uint64_t size,
               const std::string& carrier = sata) {
    addDevice(carrier + "/block/" + name, number, size);
  }
  void addPartition(const std::string& disk, int partition, const std::string& number, std::uint64_t start,
                    std::uint64_t size, const std::string& carrier = sata) {
    const auto path = carrier + "/block/" + disk + "/" + disk + std::to_string(partition);
    addDevice(path, number, size);
    write("/sys" + path + "/partition", std::to_string(partition) + "\n");
    write("/sys" + path + "/start", std::to_string(start) + "\n");
  }
  void setSubsystem(const std::string& path, const std::string& name) {
    link("/sys" + path + "/subsystem", "/sys/bus/" + name);
  }

  /// Properties that the device manager knows of a device.
  void know(const std::string& number, const std::string& properties) {
    write("/run/udev/data/b" + number, "S:disk/by-id/x\nI:123\n" + properties + "G:systemd\n");
  }

  /// An empty file of that many units of 512 bytes in the place of a disk's node.
  std::string addImage(const std::string& name, std::uint64_t size) {
    write("/dev/" + name, "");
    std::filesystem::resize_file(at("/dev/" + name), size * 512);
    return at("/dev/" + name);
  }

  /// An image whose old partition table has the signature 11223344 and one partition: 2048 units from 2048 on.
  void addMbr(const std::string& name, std::uint64_t size, char type) {
    std::fstream file(addImage(name, size), std::ios::binary | std::ios::in | std::ios::out);
    file.seekp(440).write("\x44\x33\x22\x11", 4);
    file.seekp(446).write("\x80\0\0\0\x0c\0\0\0\0\x08\0\0\0\x08\0\0", 16);
    file.seekp(450).put(type).seekp(510).write("\x55\xaa", 2);
  }

  /// One more mount, of a device by its number.
  void mount(const std::string& number, const std::string& source, const std::string& point, const std::string& type,
             const std::string& options = "rw") {
    const auto id = std::to_string(++_lastMount);
    setMounts(_mounts + id + " 1 " + number + " / " + point + " " + options + " - " + type + " " + source + " rw\n");
    std::filesystem::create_directories(at(point));
  }
  void setMounts(const std::string& mountinfo) {
    _mounts = mountinfo;
    write("/proc/thread-self/mountinfo", _mounts);
  }

 private:
  void addDevice(const std::string& path, const std::string& number, std::uint64_t size) {
    const auto name = baseName(path);
    const auto colon = number.find(':');
    write("/sys" + path + "/uevent",
          "MAJOR=" + number.substr(0, colon) + "\nMINOR=" + number.substr(colon + 1) + "\nDEVNAME=" + name + "\n");
    write("/sys" + path + "/size", std::to_string(size) + "\n");
    write("/sys" + path + "/ro", "0\n");
    link("/sys/class/block/" + name, "../.." + path);
    link("/sys/dev/block/" + number, "../.." + path);
  }

  std::string _mounts;
  int _lastMount = 20;
};

}  // namespace tavisk
