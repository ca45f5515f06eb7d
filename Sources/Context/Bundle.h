// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/PropertyValue.h>
#include <Varnel/Platform/Values/URL.h>

namespace Varnel {

/// A folder of resources with an information dictionary (Info.plist), strings tables in
/// `<language>.lproj/<Table>.strings` (property lists) and other files.
///
///     const Bundle bundle = Bundle::main();
///     bundle.localizedString("Varnel_Quit");  // "Beenden", or the key where there is no text
///
/// A cheap value; copies share what has been read. Files are read on first use and kept. A missing
/// or damaged file counts as absent. Any thread.
class VARNEL_API Bundle final {
 public:
  /// The bundle in this folder, for a user who prefers these languages (BCP 47, best first).
  /// Without a folder the bundle is empty.
  Bundle(std::optional<std::string> folder, std::vector<std::string> languages);

  /// The running application's bundle.
  [[nodiscard]] static Bundle main();

  /// The folder, absent for the empty bundle.
  [[nodiscard]] std::optional<Platform::URL> url() const;

  /// The content of Info.plist, null when there is none or it is no dictionary. Lives as long as
  /// any copy of the bundle.
  [[nodiscard]] const Platform::PropertyDictionary* infoDictionary() const;

  /// The text under a key of the information dictionary; absent when it is missing or no text.
  [[nodiscard]] std::optional<std::string> infoText(std::string_view key) const;

  /// "CFBundleIdentifier" of the information dictionary.
  [[nodiscard]] std::optional<std::string> identifier() const;

  /// The text of a key in the user's language, else in English, else `defaultValue`, and where that
  /// is empty the key itself. `tableName` absent means "Localizable".
  [[nodiscard]] std::string localizedString(
      std::string_view key, std::string_view defaultValue = {},
      const std::optional<std::string>& tableName = std::nullopt) const;

  /// The path of a file in the bundle; absent when it does not exist.
  [[nodiscard]] std::optional<std::string> resourcePath(std::string_view name) const;

 private:
  struct Content;
  std::shared_ptr<Content> content_;
};

}  // namespace Varnel
