// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/loaders/EfiProgram.h"

#include <algorithm>
#include <map>
#include <string_view>
#include <system_error>
#include <utility>

#include "base/Text.h"
#include "hosts/linux/firmware/EfiBytes.h"

namespace tavisk {
namespace {

constexpr const char* tried = "understand";
constexpr std::size_t coffSize = 24;  // with the signature in front
constexpr std::size_t sectionSize = 40;
constexpr std::size_t mostSections = 96;
constexpr std::size_t longestSectionText = 65536;
constexpr std::size_t longestData = 4194304;
constexpr std::size_t mostModules = 4096;

struct Section {
  std::uint64_t offset = 0;
  std::uint64_t size = 0;
};

/// A number at an offset; 0 behind the end.
std::uint64_t numberAt(std::string_view bytes, std::size_t offset, std::size_t width) {
  auto rest = bytes.substr(std::min(offset, bytes.size()));
  return takeNumber(rest, width).value_or(0);
}

/// Without the zeros that fill it up.
std::string untilZero(std::string_view bytes) {
  return std::string(bytes.substr(0, bytes.find('\0')));
}

/// The first ".efi" file of GRUB that is named in UTF-16, as shim keeps the name of the loader that it starts.
std::string loaderNamedIn(std::string_view data) {
  const auto beginning = toUtf16("\\grub");
  constexpr std::string_view ending = ".efi";
  constexpr std::size_t longestName = 64;
  for (auto found = data.find(beginning); found != std::string_view::npos; found = data.find(beginning, found + 1)) {
    const auto text = fromUtf16(data.substr(found + 2, longestName));
    const auto name = text.substr(0, text.find('\0'));
    if (const auto end = name.find(ending); end != std::string::npos) return name.substr(0, end + ending.size());
  }
  return {};
}

class Reader {
 public:
  Reader(FileDescriptor file, std::string path) : _file(std::move(file)), _path(std::move(path)) {}

  Result<EfiProgram> program() {
    if (const auto read = readSections(); !read) return read.failure();
    EfiProgram program;
    program.components = textIn(".sbat");
    program.osRelease = textIn(".osrel");
    program.commandLine = textIn(".cmdline");
    program.hasProfiles = _sections.contains(".profile");
    if (_sections.contains(".linux")) {
      program.kind = EfiProgram::Kind::unifiedImage;
    } else if (_sections.contains("mods")) {
      program.kind = EfiProgram::Kind::grub;
      readModules(program);
    } else if (textIn(".sdmagic").starts_with("#### LoaderInfo: systemd-boot ")) {
      program.kind = EfiProgram::Kind::systemdBoot;
    } else if (program.hasComponent("shim")) {
      readShim(program);
    }
    if (_failure) return *_failure;
    if (!_contradiction.empty()) return Failure{tried, _path, _contradiction};
    return program;
  }

 private:
  Result<void> readSections() {
    const auto beginning = bytesAt({0, 64});
    const auto header = numberAt(beginning, 60, 4);
    const auto coff = bytesAt({header, coffSize + 2});
    if (_failure) return *_failure;
    const auto count = numberAt(coff, 6, 2);
    if (!beginning.starts_with("MZ") || !coff.starts_with(std::string_view("PE\0\0", 4)) || count > mostSections)
      return Failure{tried, _path, "it is no program for UEFI",
                     std::make_error_code(std::errc::executable_format_error)};
    _is32Bit = numberAt(coff, coffSize, 2) == 0x10B;
    const auto table = bytesAt({header + coffSize + numberAt(coff, 20, 2), count * sectionSize});
    for (std::size_t at = 0; at + sectionSize <= table.size(); at += sectionSize)
      addSection(table.substr(at, sectionSize));
    return {};
  }

  void addSection(std::string_view entry) {
    const auto virtualSize = numberAt(entry, 8, 4);
    const auto fileSize = numberAt(entry, 16, 4);
    const Section section{numberAt(entry, 20, 4), virtualSize == 0 ? fileSize : std::min(virtualSize, fileSize)};
    const auto name = untilZero(entry.substr(0, 8));
    if (!_sections.emplace(name, section).second && (name == ".cmdline" || name == "mods"))
      _contradiction = "it has several sections " + name;
  }

  /// What the file has of it.
  std::string bytesAt(const Section& section) {
    auto bytes = readAt(_file, section.offset, section.size, _path);
    if (!bytes) _failure = bytes.failure();
    return std::move(bytes).valueOr("");
  }

  std::string textIn(const std::string& name) {
    const auto found = _sections.find(name);
    return found == _sections.end() ? "" : limitedText(found->second);
  }

  std::string limitedText(const Section& section) {
    if (section.size <= longestSectionText) return untilZero(bytesAt(section));
    _contradiction = "a text in it is too long";
    return {};
  }

  void readShim(EfiProgram& program) {
    for (const auto* name : {".data", ".rodata"}) {
      const auto found = _sections.find(name);
      if (found == _sections.end() || found->second.size > longestData || !program.nextLoader.empty()) continue;
      program.nextLoader = loaderNamedIn(bytesAt(found->second));
    }
    // What comes with it, to enroll keys and to make boot entries anew, is of the same component and starts no loader.
    if (!program.nextLoader.empty()) program.kind = EfiProgram::Kind::shim;
  }

  void readModules(EfiProgram& program) {
    constexpr std::uint64_t magic = 0x676D696D;
    constexpr std::uint64_t embeddedConfiguration = 2;
    constexpr std::uint64_t builtInPrefix = 3;
    constexpr std::size_t headerSize = 8;
    const auto section = _sections.at("mods");
    const auto info = bytesAt({section.offset, 24});
    const auto end = std::min(numberAt(info, _is32Bit ? 8 : 16, _is32Bit ? 4 : 8), section.size);
    auto at = numberAt(info, _is32Bit ? 4 : 8, _is32Bit ? 4 : 8);
    if (numberAt(info, 0, 4) != magic) _contradiction = "its modules cannot be read";
    for (std::size_t count = 0; at < end && _contradiction.empty(); ++count) {
      const auto header = bytesAt({section.offset + at, headerSize});
      const auto type = numberAt(header, 0, 4);
      const auto size = numberAt(header, 4, 4);
      if (size < headerSize || size > end - at || count == mostModules) {
        _contradiction = "its modules cannot be read";
      } else if (type == embeddedConfiguration) {
        program.configuration = limitedText({section.offset + at + headerSize, size - headerSize});
      } else if (type == builtInPrefix) {
        program.prefix = limitedText({section.offset + at + headerSize, size - headerSize});
      }
      at += size;
    }
  }

  FileDescriptor _file;
  std::string _path;
  std::map<std::string, Section> _sections;
  bool _is32Bit = false;
  std::optional<Failure> _failure;
  std::string _contradiction;
};

}  // namespace

bool EfiProgram::hasComponent(const std::string& name) const {
  const auto lines = split(components, "\n");
  return std::ranges::any_of(lines, [&](const auto& line) { return line.starts_with(name + ","); });
}

bool isNoProgram(const Failure& failure) {
  return failure.code == std::errc::executable_format_error;
}

Result<EfiProgram> readEfiProgram(const SystemRoot& files, const std::string& path) {
  auto file = files.openRegular(path);
  if (!file) return file.failure();
  return Reader(std::move(file).value(), path).program();
}

}  // namespace tavisk
