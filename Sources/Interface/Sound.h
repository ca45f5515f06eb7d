// SPDX-License-Identifier: MIT
#pragma once

#include <array>
#include <cstddef>
#include <functional>
#include <optional>
#include <string>

#include <Varnel/Platform/Api.h>

namespace Varnel {

class Bundle;

/// A moment of the user's journey that has a sound.
///
///     if (const auto path = Sound::scanComplete.path()) show(*path);
///
/// A value. Any thread; `path` looks into the file system.
class VARNEL_API Sound final {
 public:
  enum class Case : int {
    tutorial,
    start,
    scanComplete,
    cleanComplete,
    achievementNotification,
    rankIncreased,
    purchase
  };

  static const Sound tutorial;
  static const Sound start;
  static const Sound scanComplete;
  static const Sound cleanComplete;
  static const Sound achievementNotification;
  static const Sound rankIncreased;
  static const Sound purchase;

  constexpr Sound(Case sound) : sound_(sound) {}

  /// The case with this raw value; absent outside 0 to 6.
  [[nodiscard]] static std::optional<Sound> withRawValue(int rawValue);

  /// The seven sounds in the order of their raw values.
  [[nodiscard]] static const std::array<Sound, 7>& allValues();

  [[nodiscard]] constexpr Case case_() const { return sound_; }
  [[nodiscard]] constexpr int rawValue() const { return static_cast<int>(sound_); }

  /// The name of the resource, "ScanComplete.m4a". All are M4A files but "Purchase.aiff".
  [[nodiscard]] std::string fileName() const;

  /// Where the resource is in the framework's own bundle, or in the one given; absent when it is
  /// not there.
  [[nodiscard]] std::optional<std::string> path() const;
  [[nodiscard]] std::optional<std::string> path(const Bundle& bundle) const;

  constexpr bool operator==(const Sound&) const = default;

 private:
  Case sound_;
};

inline constexpr Sound Sound::tutorial{Sound::Case::tutorial};
inline constexpr Sound Sound::start{Sound::Case::start};
inline constexpr Sound Sound::scanComplete{Sound::Case::scanComplete};
inline constexpr Sound Sound::cleanComplete{Sound::Case::cleanComplete};
inline constexpr Sound Sound::achievementNotification{Sound::Case::achievementNotification};
inline constexpr Sound Sound::rankIncreased{Sound::Case::rankIncreased};
inline constexpr Sound Sound::purchase{Sound::Case::purchase};

}  // namespace Varnel

template <>
struct std::hash<Varnel::Sound> {
  std::size_t operator()(Varnel::Sound sound) const noexcept {
    return static_cast<std::size_t>(sound.rawValue());
  }
};
