// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace Orvane {

/// A file that the product has written for this user.
struct DataFile {
  std::string path;
  std::uint64_t bytes = 0;
  /// Why it is none, whatever its name says: "is a link". It is neither read nor removed.
  std::optional<std::string> objection{};
};

/// One of the kinds of things that the product keeps, and the files that are there.
struct DataPart {
  enum class Form { text, database, logs };

  std::string name;     ///< As commands and JSON call it.
  std::string content;  ///< The same for people.
  Form form = Form::text;
  std::string path;     ///< Of its main file; of the folder, where each file is one.
  std::string table{};  ///< The one that is counted, of a database.
  std::string lock{};   ///< What is added to the path for whom is at work with it; or empty.
  std::vector<DataFile> files{};

  [[nodiscard]] std::uint64_t bytes() const;
};

/// The folder that a part's files lie in.
[[nodiscard]] std::string folderOf(const DataPart& part);

/// All that the product keeps for this user: settings, events, removals, reminders and logs, in
/// this order; those without a file, too.
[[nodiscard]] std::vector<DataPart> productData();

/// The files of the logs alone.
[[nodiscard]] std::vector<DataFile> productLogs();

/// The files of a part that are there now.
[[nodiscard]] std::vector<DataFile> filesOf(const DataPart& part);

/// Removes one that is this user's own; returns why it stays, or nothing.
[[nodiscard]] std::optional<std::string> removeFile(const DataFile& file);

/// Whether it holds what a part keeps, and is no lock or journal beside that.
[[nodiscard]] bool hasContent(const DataFile& file);

}  // namespace Orvane
