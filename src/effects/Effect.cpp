// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "effects/Effect.h"

#include "base/Json.h"

namespace tavisk {
namespace {

void addIfKnown(JsonObject& object, std::string_view name, const std::optional<std::string>& value) {
  if (value) object.text(name, *value);
}

void addIfAny(JsonObject& object, std::string_view name, const std::string& value) {
  if (!value.empty()) object.text(name, value);
}

void addFailure(JsonObject& object, const Failure& failure) {
  addIfAny(object, "tried", failure.tried);
  addIfAny(object, "on", failure.on);
  addIfAny(object, "why", failure.why);
}

}  // namespace

const char* nameOf(Outcome outcome) {
  switch (outcome) {
    case Outcome::applied:
      return "applied";
    case Outcome::unchanged:
      return "unchanged";
    case Outcome::notSupported:
      return "not supported";
    case Outcome::failed:
      break;
  }
  return "failed";
}

std::string toJson(const Effect& effect) {
  JsonObject object;
  object.text("setting", effect.setting).text("outcome", nameOf(effect.outcome));
  addIfKnown(object, "before", effect.before);
  addIfKnown(object, "asked", effect.asked);
  addIfKnown(object, "live", effect.live);
  addIfKnown(object, "stored", effect.stored);
  addIfAny(object, "where", effect.where);
  addIfAny(object, "undoneBy", effect.undoneBy);
  addIfAny(object, "note", effect.note);
  if (effect.failure) addFailure(object, *effect.failure);
  return object.str();
}

std::string toJson(const SettingValue& value) {
  JsonObject object;
  object.text("setting", value.setting);
  addIfKnown(object, "live", value.live);
  addIfKnown(object, "stored", value.stored);
  addIfAny(object, "unit", value.unit);
  if (value.unsupported) {
    object.boolean("supported", false);
    addFailure(object, *value.unsupported);
  }
  return object.str();
}

}  // namespace tavisk
