// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/loaders/GrubMenu.h"

#include <algorithm>

#include "base/Text.h"

namespace tavisk::grub {
namespace {

constexpr int mostLookedInto = 100;  // of which it is worked out what they start
constexpr const char* chosenEntry = "default";
constexpr int deepestSubmenu = 16;
constexpr char below = '>';  // between the names of a submenu and of its entry
constexpr const char* escapedBelow = ">>";

/// What every GRUB since 2.00 says of itself (grub-core/normal/main.c).
constexpr const char* features[] = {
    "feature_200_final",
    "feature_all_video_module",
    "feature_chainloader_bpb",
    "feature_default_font_path",
    "feature_menuentry_id",
    "feature_menuentry_options",
    "feature_nativedisk_cmd",
    "feature_ntldr",
    "feature_platform_search_hint",
    "feature_timeout_style",
};

Failure unproven(std::string why) {
  return {"tell what GRUB starts", "", std::move(why)};
}

Result<State> certain(const Interpreter& interpreter) {
  if (interpreter.doubt()) return unproven(*interpreter.doubt());
  return interpreter.state();
}

bool isNamed(const Entry& entry, const std::string& name) {
  return entry.title == name || (!entry.id.empty() && entry.id == name);
}

bool mayBeNumber(std::string_view name) {
  name = trimmed(name);
  return !name.empty() && isDigit(name.front());
}

/// Whether it is one for every GRUB, and not for some, as "0x1", "010" and "2nd system" are up to 2.06.
bool isPlainNumber(std::string_view name) {
  constexpr std::size_t mostDigits = 9;
  return !name.empty() && name.size() <= mostDigits && std::ranges::all_of(name, isDigit) &&
         (name == "0" || name.front() != '0');
}

/// By its number, title or identifier; as GRUB does, the first of all when there is none of the kind.
Result<Entry> entryNamed(const std::string& name, const std::vector<Entry>& entries) {
  if (entries.empty()) return unproven("there is no entry");
  const auto number = isPlainNumber(name) ? parseNumber<std::size_t>(name) : std::nullopt;
  const auto named = std::ranges::find_if(entries, [&](const auto& entry) { return isNamed(entry, name); });
  // A GRUB that makes entries of files takes a whole name for a name.
  const bool isCertain = number || !mayBeNumber(name) || (named != entries.end() && named->isLoaderEntry);
  if (!isCertain) return unproven("whether its default " + name + " is a number cannot be told");
  const bool isByName = !number && named != entries.end();
  const auto index = number.value_or(0) < entries.size() ? number.value_or(0) : 0;
  const auto chosen = isByName ? named : entries.begin() + static_cast<std::ptrdiff_t>(index);
  if (std::all_of(isByName ? chosen : entries.begin(), chosen + 1, [](const auto& entry) { return entry.isCertain; }))
    return *chosen;
  return unproven("whether its entry " + name + " is there hangs on a condition that cannot be told");
}

Menu menuIn(const State& state) {
  // What is written into one of several need not be what counts.
  const auto& blocks = state.environments;
  const auto environment = blocks.size() == 1 ? std::optional(blocks.front()) : std::nullopt;
  return {state.entries, state.variables, state.functions, state.exported, state.configuration, environment};
}

Result<Menu> menuMadeBy(const Interpreter& interpreter) {
  const auto end = certain(interpreter);
  if (!end) return end.failure();
  if (!end->starts.empty()) return unproven("it starts something without a menu");
  return menuIn(*end);
}

/// By which a default may name it for certain; empty: by none.
std::string nameOf(const Entry& entry) {
  const auto& name = entry.id.empty() ? entry.title : entry.id;
  const bool isDoubtful = name.find(below) != std::string::npos || (mayBeNumber(name) && !entry.isLoaderEntry);
  return isDoubtful ? "" : name;
}

}  // namespace

State MenuReader::beginning() const {
  State state{.variables = _variables};
  for (const auto* feature : features) state.variables[feature] = "y";
  for (const auto& [name, value] : state.variables) state.exported.insert(name);
  return state;
}

Result<Menu> MenuReader::menuOf(const FilePlace& configuration, const Environment& replaced) const {
  Interpreter interpreter(_files, replaced, beginning());
  interpreter.goOnWith(configuration);
  return menuMadeBy(interpreter);
}

Result<Menu> MenuReader::menuOfText(const std::string& text, const Environment& replaced) const {
  const auto script = parseScript(text + "\nnormal\n");
  if (!script) return unproven("what is built into it is not of GRUB's language");
  Interpreter interpreter(_files, replaced, beginning());
  interpreter.run(*script);
  return menuMadeBy(interpreter);
}

Result<Start> MenuReader::startOfDefault(const Menu& menu) const {
  const auto found = menu.variables.find(chosenEntry);
  if (found == menu.variables.end()) return startOf(menu, "0");
  if (!found->second) return unproven("its default hangs on a condition that cannot be told");
  return startOf(menu, *found->second);
}

Result<Start> MenuReader::startOf(const Menu& menu, const std::string& choice) const {
  if (choice.find(escapedBelow) != std::string::npos) return unproven("its default " + choice + " has an escape");
  auto rest = choice;
  Result<Menu> inner = menu;
  for (int depth = 0; inner && depth < deepestSubmenu; ++depth) {
    const auto end = rest.find(below);
    const auto entry = entryNamed(rest.substr(0, end), inner->entries);
    if (!entry) return entry.failure();
    if (!entry->isSubmenu) return startOf(*entry, *inner);
    inner = submenuOf(*entry, *inner);
    rest = end == std::string::npos ? "0" : rest.substr(end + 1);
  }
  return inner ? unproven("it has submenus without end") : inner.failure();
}

Result<State> MenuReader::goThrough(const Entry& entry, const Menu& menu) const {
  State state{.variables = menu.variables, .functions = menu.functions, .exported = menu.exported};
  if (entry.isSubmenu) {
    state.variables = exportedOf(state);
    state.variables.erase(chosenEntry);
  }
  Interpreter interpreter(_files, {}, std::move(state));
  interpreter.run(*entry.body);
  return certain(interpreter);
}

Result<Start> MenuReader::startOf(const Entry& entry, const Menu& menu) const {
  const auto end = goThrough(entry, menu);
  if (!end) return end.failure();
  if (end->starts.size() == 1) return end->starts.front();
  return unproven("its entry " + entry.title + (end->starts.empty() ? " starts nothing" : " starts several things"));
}

Result<Menu> MenuReader::submenuOf(const Entry& entry, const Menu& menu) const {
  const auto end = goThrough(entry, menu);
  if (!end) return end.failure();
  if (end->variables.contains(chosenEntry)) return unproven("its submenu " + entry.title + " has a default of its own");
  return menuIn(*end);
}

std::vector<NamedStart> MenuReader::startsOf(const Menu& menu) const {
  std::vector<NamedStart> starts;
  int left = mostLookedInto;
  addStarts(menu, "", left, starts);
  return starts;
}

void MenuReader::addStarts(const Menu& menu, const std::optional<std::string>& above, int& left,
                           std::vector<NamedStart>& starts) const {
  for (const auto& entry : menu.entries) {
    if (--left < 0) return;
    if (!entry.isCertain) continue;
    const auto name = nameOf(entry);
    const auto choice = above && !name.empty() ? std::optional(*above + name) : std::nullopt;
    if (entry.isSubmenu) {
      const auto inner = choice ? std::optional(*choice + below) : std::nullopt;
      if (const auto submenu = submenuOf(entry, menu)) addStarts(*submenu, inner, left, starts);
    } else if (const auto start = startOf(entry, menu)) {
      starts.push_back({choice.value_or(""), *start});
    }
  }
}

}  // namespace tavisk::grub
