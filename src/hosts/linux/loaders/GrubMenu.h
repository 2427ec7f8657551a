// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <vector>

#include "base/Result.h"
#include "hosts/linux/loaders/GrubInterpreter.h"

namespace tavisk::grub {

/// A menu as it is when GRUB shows it.
struct Menu {
  std::vector<Entry> entries;
  Variables variables;  ///< "default" among them
  Functions functions;
  std::set<std::string, std::less<>> exported = {};
  FilePlace configuration = {};
  std::optional<FilePlace> environment = {};  ///< the only environment block that it was made with
};

/// An entry that starts something, with the text by which a default or a saved entry names it:
/// "gnulinux-simple-UUID", "submenu>entry".
struct NamedStart {
  std::string choice;  ///< empty: no text names it for certain
  Start start;
};

/// What GRUB would do, worked out from its configuration. Nothing is owned.
class MenuReader {
 public:
  /// `variables` has what the loader begins with: "prefix", "root", "grub_platform".
  MenuReader(const Files& files, Variables variables) : _files(files), _variables(std::move(variables)) {}

  /// Fails when what the menu holds cannot be told for certain; why says what stood against it. The variables of
  /// `replaced` have these values, whatever the environment block says.
  Result<Menu> menuOf(const FilePlace& configuration, const Environment& replaced = {}) const;
  /// The same for what is built into the loader: where it ends, GRUB goes on with "grub.cfg" of its prefix.
  Result<Menu> menuOfText(const std::string& text, const Environment& replaced = {}) const;
  /// What the default entry of a menu starts; fails when that cannot be told for certain.
  Result<Start> startOfDefault(const Menu& menu) const;
  /// The entries of which it can be told what they start, those of submenus too; of the first 100.
  std::vector<NamedStart> startsOf(const Menu& menu) const;

 private:
  State beginning() const;
  Result<Start> startOf(const Menu& menu, const std::string& choice) const;
  void addStarts(const Menu& menu, const std::optional<std::string>& above, int& left,
                 std::vector<NamedStart>& starts) const;
  Result<Start> startOf(const Entry& entry, const Menu& menu) const;
  Result<Menu> submenuOf(const Entry& entry, const Menu& menu) const;
  Result<State> goThrough(const Entry& entry, const Menu& menu) const;

  const Files& _files;
  Variables _variables;
};

}  // namespace tavisk::grub
