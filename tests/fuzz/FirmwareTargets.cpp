// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <algorithm>

#include "base/Text.h"
#include "fuzz/Targets.h"
#include "hosts/linux/firmware/BootEntries.h"
#include "hosts/linux/firmware/EfiBytes.h"
#include "hosts/linux/loaders/EfiProgram.h"
#include "hosts/linux/loaders/LoaderEntries.h"
#include "hosts/linux/loaders/MenuFiles.h"

namespace tavisk::fuzz {
namespace {

void holdPath(std::string_view bytes) {
  const auto path = parseDevicePath(bytes);
  if (!path) return;
  hold(parseDevicePath(bytesOf(*path)) == path, "a device path is written as it was read");
  look(textOf(*path), networkPathOf(*path), isLegacyBoot(*path));
  if (const auto file = fileOf(*path)) {
    hold(isUtf8(*file) && file->find('\0') == std::string::npos, "a file has a name");
    hold(fileOf({fileNode(*file)}) == file, "which is written as it was read");
  }
  const auto partition = partitionOf(*path);
  const auto node = partition ? partitionNode(*partition) : std::nullopt;
  if (!node) return;
  const auto same = partitionOf({*node});
  hold(same && same->uuid.substr(0, 8) == partition->uuid.substr(0, 8) && same->number == partition->number &&
           same->start == partition->start && same->size == partition->size,
       "a partition is written as it was read");
}

std::vector<std::uint16_t> without(std::vector<std::uint16_t> order, std::uint16_t number) {
  std::erase(order, number);
  return order;
}

grub::MenuFiles menuFiles(std::string_view bytes) {
  constexpr const char* paths[] = {"/grub/grub.cfg", "/grub/other.cfg", "/grub/grubenv", "/loader/entries/a-1-2.conf"};
  grub::MenuFiles menu;
  for (std::size_t i = 0; i < std::size(paths); ++i) menu.files[paths[i]] = partOf(bytes, i);
  menu.files["/grub/grubenv"].resize(grub::environmentSize, '#');
  menu.entries = split(partOf(bytes, 4), "\n/");
  for (const auto& name : menu.entries) menu.files["/loader/entries/" + name] = partOf(bytes, 3);
  return menu;
}

void holdMenu(const grub::MenuReader& reader, const Result<grub::Menu>& menu) {
  if (!isDone(menu)) return;
  if (const auto start = reader.startOfDefault(*menu); isDone(start))
    hold(!start->program.device.empty(), "what is started is somewhere");
  for (const auto& named : reader.startsOf(*menu))
    hold(named.choice.find(">>") == std::string::npos, "an entry is named without escapes");
}

}  // namespace

void efiPaths(std::string_view bytes) {
  holdPath(bytes);
  if (const auto option = parseLoadOption(bytes)) {
    const auto written = bytesOf(*option);
    const auto same = parseLoadOption(written);
    hold(same && bytesOf(*same) == written && same->startsAs(*option), "a load option is written as it was read");
    look(targetText(*option));
    holdPath(option->paths);
  }
  const auto text = fromUtf16(bytes);
  hold(isUtf8(text) || bytes.empty(), "UTF-16 becomes a text");
  hold(fromUtf16(toUtf16(text)) == text, "which is written as it was read");
  if (const auto guid = guidBytes(bytes)) hold(guidText(*guid) == lowerCased(bytes), "so is an identifier");
}

void efiVariables(std::string_view bytes) {
  static Tree tree;
  tree.clear();
  constexpr const char* names[] = {"BootOrder", "BootNext", "BootCurrent", "Boot0000", "Boot0001", "Boot000A"};
  for (std::size_t i = 0; i < std::size(names); ++i)
    if (const auto value = partOf(bytes, i); !value.empty()) tree.put(EfiVariables::pathOf({names[i]}), value);
  const EfiVariables variables(tree.root);
  const BootEntries entries(variables);
  const auto all = entries.all();
  look(variables.support(), entries.first(), entries.onlyNext(), entries.current());
  if (!isDone(all)) return;
  for (const auto& entry : *all) hold(bootEntryNumber(bootEntryName(entry.number)) == entry.number, "it has a number");
  if (const auto first = entries.first(); first && *first)
    hold((*first)->option.isStartedUnasked(), "the first is started");
  const auto before = entries.order();
  EfiLoadOption wanted{.description = "new", .paths = bytesOf(EfiDevicePath{fileNode("\\a.efi")}), .data = ""};
  if (!all->empty()) wanted = all->front().option;
  WrittenPlaces written;
  const auto put = entries.putFirst(
      wanted, [](const auto&) { return Result<void>(); }, written);
  tree.put(EfiVariables::pathOf({"Boot0000"}), "");
  tree.put(EfiVariables::pathOf({"Boot0002"}), "");
  if (!put || !before) return;
  const auto after = entries.order();
  hold(after && !after->empty(), "there is an order");
  hold(without(*after, after->front()) == without(*before, after->front()), "all others keep their places");
}

void efiProgram(std::string_view bytes) {
  static Tree tree;
  tree.renew({{"/x.efi", std::string(bytes)}});
  const auto program = readEfiProgram(tree.root, "/x.efi");
  if (!isDone(program)) return;
  for (const auto* text : {&program->components, &program->nextLoader, &program->configuration, &program->prefix,
                           &program->commandLine, &program->osRelease})
    hold(text->find('\0') == std::string::npos && text->size() <= bytes.size() * 2, "a text is one of the file's");
  look(program->hasComponent("grub.debian"));
}

void grubScript(std::string_view bytes) {
  const auto files = menuFiles(bytes);
  const grub::MenuReader reader(files,
                                {{"root", "hd0,gpt2"}, {"prefix", "(hd0,gpt2)/grub"}, {"unknown", std::nullopt}});
  holdMenu(reader, reader.menuOf({"hd0,gpt2", "/grub/grub.cfg"}));
  holdMenu(reader, reader.menuOf({"hd0,gpt2", "/grub/grub.cfg"}, {{"saved_entry", "0"}}));
  holdMenu(reader, reader.menuOfText(partOf(bytes, 1)));
}

void grubEnvironment(std::string_view bytes) {
  auto block = partOf(bytes, 0);
  block.resize(grub::environmentSize, '#');
  const auto value = partOf(bytes, 2);
  const auto before = grub::environmentIn(block);
  const auto written = grub::withVariable(block, "saved_entry", value);
  hold(before || !written, "what is no block is not written");
  if (!before || !written) return;
  const auto after = grub::environmentIn(*written);
  hold(after && written->size() == grub::environmentSize, "what is written is a block");
  auto wanted = *before;
  wanted["saved_entry"] = value;
  if (value.empty()) wanted.erase("saved_entry");
  hold(*after == wanted, "with this value, and all others as they were");
}

void loaderEntries(std::string_view bytes) {
  std::vector<LoaderEntry> entries;
  std::vector<std::string> lines;
  for (const auto part : partsOf(bytes)) {
    const auto id = std::string(part.substr(0, part.find('\n')));
    for (const auto quotes : {Quotes::kept, Quotes::removed})
      if (auto entry = parseLoaderEntry(id, part, quotes)) entries.push_back(std::move(*entry));
    lines.push_back(id);
    look(hasPreferredEntry(part));
  }
  sortAsShown(entries);
  const auto* started = startedOf(entries, {defaultEntryIn(bytes), "a*"});
  hold((started == nullptr) == entries.empty(), "one of the entries is started");
  lines.resize(3);
  const auto order = [&](std::size_t left, std::size_t right) {
    return compareVersions(lines.at(left), lines.at(right)) <=> 0;
  };
  hold(order(0, 1) == (0 <=> order(1, 0)) && order(0, 0) == 0, "versions have an order");
  hold(order(0, 1) > 0 || order(1, 2) > 0 || order(0, 2) <= 0, "which goes on from one to the next");
}

}  // namespace tavisk::fuzz
