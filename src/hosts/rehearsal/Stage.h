// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <map>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "effects/EffectSink.h"
#include "hosts/scratch/MachineFile.h"
#include "platform/Host.h"

namespace tavisk {

/// Where changes of a machine are rehearsed: the machine itself, which only foretells, and its copy, to which they are
/// done as far as the machine would do them. What the machine refuses is refused by the copy, with the reason.
class Stage final : public EffectChannel {
 public:
  /// What both work with; nothing is owned. Each tells its effects to its own sink.
  struct Players {
    Host& machine;
    EffectSink& machineEffects;
    Host& copy;
    EffectSink& copyEffects;
    MachineFile& copyFile;
  };
  /// What happens on the stage is told to `audience`, as the machine would tell it.
  Stage(const Players& players, EffectSink& audience);
  ~Stage() override;
  Stage(const Stage&) = delete;
  Stage& operator=(const Stage&) = delete;

  Host& machine() { return _players.machine; }
  Host& copy() { return _players.copy; }

  using Effects = std::vector<Effect>;
  using Act = std::function<void(Host&)>;
  /// The same on both: foretold, then done. What the machine says of it, in view of what was rehearsed before.
  Effects play(const Act& act);
  /// Where the copy is to do what depends on that.
  Effects play(const Act& onMachine, const std::function<void(Host&, const Effects&)>& onCopy);
  /// What the machine says, and nothing more is done.
  Effects foretold(const Act& act);
  void tell(const Effects& effects);
  void tell(const SettingValue& value) { _audience.observe(value); }
  /// Changes of the copy that no service makes.
  void edit(const MachineFile::Edit& edit);

  /// A setting after what was rehearsed.
  struct State {
    std::string asked;  ///< what was asked for last and has come about
    std::optional<std::string> live;
    std::optional<std::string> stored;
  };
  /// Absent: it is as the machine has it.
  std::optional<State> stateOf(const std::string& setting) const;

  void record(const Effect& effect) override;
  void observe(const SettingValue& value) override;
  bool wantsValues() const override { return _audience.wantsValues(); }
  bool wantsPlaces() const override { return _audience.wantsPlaces(); }

 private:
  /// What the machine tells: kept while it foretells, and told on when it is asked what the copy does not have.
  class Foretold final : public EffectChannel {
   public:
    explicit Foretold(EffectSink& audience) : _audience(audience) {}

    void record(const Effect& effect) override {
      if (!_isForetelling) return _audience.record(effect);
      _effects.push_back(effect);
    }
    void observe(const SettingValue& value) override {
      if (!_isForetelling) _audience.observe(value);
    }
    bool wantsValues() const override { return !_isForetelling && _audience.wantsValues(); }
    bool wantsPlaces() const override { return !_isForetelling && _audience.wantsPlaces(); }

    /// What is told while this is done.
    Effects during(const std::function<void()>& asked) {
      _isForetelling = true;
      asked();
      _isForetelling = false;
      return std::exchange(_effects, {});
    }

   private:
    EffectSink& _audience;
    Effects _effects;
    bool _isForetelling = false;
  };
  Effect inViewOfState(Effect effect) const;
  void refuse(const Effects& effects);
  void remember(const Effect& effect);

  Players _players;
  EffectSink& _audience;
  Foretold _foretold;
  bool _isPlaying = false;
  std::map<std::string, Effect> _copyFailures;  ///< while it plays
  std::map<std::string, State> _states;
};

}  // namespace tavisk
