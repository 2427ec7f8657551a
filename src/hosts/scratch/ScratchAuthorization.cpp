// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/scratch/ScratchAuthorization.h"

#include <limits>

#include "effects/SettingNames.h"

namespace tavisk {
namespace {

constexpr const char* authorizationSection = "Authorization";
constexpr const char* adminGroup = "admin";
constexpr GroupId adminId = 80;

/// A number that is no id becomes the largest one, which belongs to nobody; above all not 0.
unsigned idOf(std::int64_t number) {
  constexpr auto largest = std::numeric_limits<unsigned>::max();
  return number < 0 || number > largest ? largest : static_cast<unsigned>(number);
}

MachineSetting<bool> authenticated() {
  return switchAt(setting::authorization, authorizationSection, "Authenticated");
}

}  // namespace

UserId ScratchUserDatabase::realUserId() {
  return idOf(_machine.section("User").integer("ID"));
}

std::optional<std::vector<GroupId>> ScratchUserDatabase::supplementaryGroups(std::size_t room) {
  std::vector<GroupId> groups;
  const auto user = _machine.section("User");
  if (const auto* ids = user.find("Groups")) {
    for (const auto& id : *ids->asArray()) groups.push_back(idOf(*id.asInteger()));
  }
  if (groups.size() > room) return std::nullopt;
  return groups;
}

std::optional<GroupId> ScratchUserDatabase::groupNamed(const std::string& name) {
  const auto groups = _machine.section("Group Database");
  if (groups.isAbsent()) return name == adminGroup ? std::optional(adminId) : std::nullopt;
  const auto* id = groups.find(name);
  if (!id) return std::nullopt;
  return idOf(*id->asInteger());
}

void ScratchAdminAuthenticator::authenticate() {
  _settings.note(authenticated(), true);
}

bool ScratchAdminAuthenticator::isAuthenticated() {
  return _settings.isOn(authenticated());
}

void ScratchAdminAuthenticator::deauthenticate() {
  auto counted = authenticated();
  counted.write = [store = counted.write](MachineFile::Dictionary& machine, bool isAuthenticated) {
    store(machine, isAuthenticated);
    countUp(machine.dictionary(authorizationSection), "Deauthentications");
  };
  _settings.note(counted, false);
}

}  // namespace tavisk
