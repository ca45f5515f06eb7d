// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <string_view>
#include <vector>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/URL.h>

namespace Varnel::Platform {

/// A path taken apart at its slashes. An absolute path starts with the component "/".
using PathComponents = std::vector<std::string>;

/// Walks over the components of a path without copying them:
///
///     PathReader reader("/Users/ann/");
///     while (!reader.atEnd()) use(reader.next());  // "/", "Users", "ann", "/"
///
/// A leading slash and a trailing slash are components "/" of their own; runs of slashes count as
/// one; "." and ".." are components as any other. The reader looks into the text it was given.
class VARNEL_API PathReader final {
 public:
  explicit PathReader(std::string_view path) : path_(path) {}

  [[nodiscard]] bool atEnd() const { return position_ == path_.size(); }

  /// The next component; the reader moves behind it. Not to be called at the end.
  [[nodiscard]] std::string_view next();

 private:
  std::string_view path_;
  std::size_t position_ = 0;
};

/// Every component of a path as `PathReader` gives them; none for an empty text. Any thread.
[[nodiscard]] VARNEL_API PathComponents pathComponents(std::string_view path);

/// The components of a URL's path; the trailing slash of a folder does not count. Any thread.
[[nodiscard]] VARNEL_API PathComponents pathComponents(const URL& url);

/// The path of these components, with one slash between each two: runs of slashes are collapsed and
/// a trailing "/" vanishes, so that {"~", "/"} gives "~". Any thread.
[[nodiscard]] VARNEL_API std::string joinPathComponents(const PathComponents& components);

/// Adds one component to the end of a path, with a slash between where one is missing. An empty
/// component adds nothing, nor does "/" to anything but an empty path.
VARNEL_API void appendPathComponent(std::string& path, std::string_view component);

/// The name of one file or folder for any text: itself, if it can be one. Slashes and null
/// characters become "_", and so do "", "." and "..", which name no file of their own.
[[nodiscard]] VARNEL_API std::string fileNameFor(std::string text);

}  // namespace Varnel::Platform
