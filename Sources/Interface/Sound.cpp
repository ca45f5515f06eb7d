// SPDX-License-Identifier: MIT
#include <Varnel/Interface/Sound.h>

#include <Varnel/Context/Bundle.h>
#include <Varnel/Modules/VarnelModule.h>

namespace Varnel {

std::optional<Sound> Sound::withRawValue(int rawValue) {
  for (const Sound sound : allValues())
    if (sound.rawValue() == rawValue) return sound;
  return std::nullopt;
}

const std::array<Sound, 7>& Sound::allValues() {
  static constexpr std::array<Sound, 7> values = {
      tutorial,      start,   scanComplete, cleanComplete, achievementNotification,
      rankIncreased, purchase};
  return values;
}

std::string Sound::fileName() const {
  switch (sound_) {
    case Case::tutorial:
      return "Tutorial.m4a";
    case Case::start:
      return "Start.m4a";
    case Case::scanComplete:
      return "ScanComplete.m4a";
    case Case::cleanComplete:
      return "CleanComplete.m4a";
    case Case::achievementNotification:
      return "AchievementNotification.m4a";
    case Case::rankIncreased:
      return "RankIncreased.m4a";
    case Case::purchase:
      return "Purchase.aiff";
  }
  return {};
}

std::optional<std::string> Sound::path() const {
  return path(VarnelModule::instance()->bundle());
}

std::optional<std::string> Sound::path(const Bundle& bundle) const {
  return bundle.resourcePath(fileName());
}

}  // namespace Varnel
