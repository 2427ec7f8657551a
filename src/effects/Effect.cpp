// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "effects/Effect.h"

#include "base/Json.h"

namespace tavisk {
namespace {

void addFailure(JsonObject& object, const Failure& failure) {
  object.textUnlessEmpty("tried", failure.tried);
  object.textUnlessEmpty("on", failure.on);
  object.textUnlessEmpty("why", failure.why);
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

void addMembers(JsonObject& object, const Effect& effect) {
  object.text("setting", effect.setting).text("outcome", nameOf(effect.outcome));
  object.textIfKnown("before", effect.before);
  object.textIfKnown("asked", effect.asked);
  object.textIfKnown("live", effect.live);
  object.textIfKnown("stored", effect.stored);
  object.textUnlessEmpty("where", effect.where);
  object.textUnlessEmpty("undoneBy", effect.undoneBy);
  object.textUnlessEmpty("note", effect.note);
  if (effect.failure) addFailure(object, *effect.failure);
}

std::string toJson(const Effect& effect) {
  JsonObject object;
  addMembers(object, effect);
  return object.str();
}

std::string toJson(const SettingValue& value) {
  JsonObject object;
  object.text("setting", value.setting);
  object.textIfKnown("live", value.live);
  object.textIfKnown("stored", value.stored);
  object.textUnlessEmpty("unit", value.unit);
  if (value.unsupported) {
    object.boolean("supported", false);
    addFailure(object, *value.unsupported);
  }
  return object.str();
}

}  // namespace tavisk
