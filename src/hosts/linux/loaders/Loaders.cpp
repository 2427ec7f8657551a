// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/loaders/Loaders.h"

#include <algorithm>

#include "base/Path.h"
#include "base/Text.h"
#include "hosts/linux/firmware/EfiBytes.h"
#include "hosts/linux/firmware/EfiDevicePath.h"
#include "hosts/linux/loaders/EfiProgram.h"
#include "hosts/linux/loaders/GrubLoader.h"
#include "hosts/linux/loaders/SystemStarts.h"
#include "hosts/linux/loaders/SystemdBoot.h"

namespace tavisk {
namespace {

/// What firmware starts, and what it hands to it.
struct Target {
  std::string path;
  std::string options;
};

/// From the top of the partition.
Result<std::string> pathOf(const std::string& file) {
  auto path = withSlashes(file);
  if (!path.starts_with('/')) path.insert(path.begin(), '/');
  const auto parts = split(path, "/");
  if (parts.empty() || std::ranges::find(parts, "..") != parts.end()) return notProven(file, "it is no path of a file");
  return path;
}

/// Options as they are stored, in UTF-16, or as text.
std::string textOfOptions(const std::string& options) {
  const bool isWide = options.size() > 1 && options[1] == '\0';
  auto text = isWide ? fromUtf16(options) : options;
  std::erase(text, '\0');
  return std::string(trimmed(text));
}

/// What a shim starts: the file that its options name first (README of shim), else the loader beside it.
Result<Target> nextOf(const EfiProgram& shim, const Target& target) {
  auto words = split(textOfOptions(target.options), " \t");
  if (words.empty()) return Target{folderOf(target.path) + "/" + shim.nextLoader, ""};
  const auto first = words.front();
  if (!lowerCased(first).ends_with(".efi")) return notProven(target.path, "the options of shim name no loader");
  const auto isAbsolute = first.starts_with('\\') || first.starts_with('/');
  const auto path = pathOf(isAbsolute ? first : folderOf(target.path) + "/" + first);
  if (!path) return path.failure();
  return Target{*path, words.size() > 1 ? words[1] : ""};
}

/// Started as the medium's own loader, a shim makes boot entries anew where it finds the program for that beside it.
Result<void> needsNoFallback(const SystemRoot& files, const Target& target) {
  const auto folder = lowerCased(folderOf(target.path));
  const auto name = lowerCased(target.path.substr(folder.size()));
  if (folder != "/efi/boot" || !name.starts_with("/boot")) return {};
  const auto names = files.list(folderOf(target.path));
  if (!names) return names.failure();
  const auto isFallback = [](const auto& each) {
    return beginsIgnoringCase(each, "fb") && lowerCased(each).ends_with(".efi");
  };
  if (std::ranges::none_of(*names, isFallback)) return {};
  return notProven(target.path, "it makes boot entries anew and starts one of them");
}

/// The loader that firmware comes to, shim or not.
Result<EfiProgram> loaderBehind(const SystemRoot& files, Target& target) {
  auto program = readEfiProgram(files, target.path);
  if (!program || program->kind != EfiProgram::Kind::shim) return program;
  if (const auto isPlain = needsNoFallback(files, target); !isPlain) return isPlain.failure();
  const auto next = nextOf(*program, target);
  if (!next) return next.failure();
  target = *next;
  return readEfiProgram(files, target.path);
}

LoaderReading readUnifiedImage(const Volumes& volumes, const Volume& partition, const Target& target,
                               const EfiProgram& program) {
  LoaderReading reading;
  reading.loader = "unified image";
  reading.next = startOfUnifiedImage(volumes, partition, target.path, program, textOfOptions(target.options));
  reading.lasting = reading.next;
  if (reading.next) reading.starts.push_back(*reading.next);
  return reading;
}

}  // namespace

Result<LoaderReading> readLoader(const Volumes& volumes, const Volume& partition, const std::string& file,
                                 const std::string& options, const LoaderVariables& variables) {
  const auto path = pathOf(file);
  if (!path) return path.failure();
  const auto files = volumes.filesOf(partition);
  if (!files) return files.failure();
  Target target{*path, options};
  const auto program = loaderBehind(*files, target);
  if (!program) return program.failure();
  switch (program->kind) {
    case EfiProgram::Kind::grub: {
      const auto beginning = grub::beginningOf(*program, volumes, partition, target.path);
      if (!beginning) return beginning.failure();
      return grub::readMenu(volumes, *beginning);
    }
    case EfiProgram::Kind::systemdBoot:
      return readSystemdBoot(volumes, partition, variables);
    case EfiProgram::Kind::unifiedImage:
      return readUnifiedImage(volumes, partition, target, *program);
    case EfiProgram::Kind::shim:
    case EfiProgram::Kind::other:
      break;
  }
  return notProven(placeText(partition, target.path), "it is no loader that is known");
}

Result<LoaderReading> readGrubFolder(const Volumes& volumes, const Volume& volume, const std::string& folder) {
  const auto isThere = volumes.isThere(volume, folder + "/grub.cfg");
  if (!isThere) return isThere.failure();
  if (!*isThere) return notProven(placeText(volume, folder), "there is no grub.cfg");
  return grub::readMenu(volumes, grub::beginningIn(volume, folder));
}

std::optional<Failure> whyNotChosen(const Volumes& volumes, const LoaderReading& reading, const SystemStart& start) {
  if (reading.keeps.kind == LoaderDefault::Kind::none && !reading.grub)
    return Failure{"choose", reading.loader, "it keeps no default"};
  if (start.choice.empty()) return Failure{"choose", start.kernel, "its entry has no name of its own"};
  return reading.grub ? grub::whyNotChosen(volumes, reading, start) : std::nullopt;
}

}  // namespace tavisk
