// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include <Varnel/Basalt/FuzzyByteCountFormatter.h>
#include <Varnel/Logging/LoggedError.h>
#include <Varnel/Logging/LoggingContextTag.h>
#include <Varnel/Logging/SourcePosition.h>
#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Text/ByteCountFormatter.h>
#include <Varnel/Platform/Text/DateFormatter.h>
#include <Varnel/Platform/Text/DurationFormatter.h>
#include <Varnel/Platform/Values/Date.h>
#include <Varnel/Platform/Values/URL.h>

namespace Varnel::Platform {
class AppendFiles;
class Clock;
class PrivateFiles;
class StandardOutput;
class TimeZones;
class UserAccount;
class UserLocale;
struct Ports;
}  // namespace Varnel::Platform

namespace Varnel {

class LogFileChannel;

/// The log: each entry goes to the standard output and to the file of the day on which the process
/// started, "~/Library/Logs/IDENTIFIER/2026-03-14.log".
///
///     Logger& logger = Logger::instance();
///     logger.log("Did finish", "Scanner", {LoggingContextTag::location(folder)});
///     logger.logError(error, "Scanner");
///
/// Any thread. Callers never wait for the disk: the file gets its entries after at most a second,
/// or as soon as there are 4096 bytes of them, and the rest when the process exits. Nothing throws
/// and nothing is reported to callers: failures of the file are printed on the standard output. An
/// entry without tags is logged without the argument: "{}" would be ambiguous.
class VARNEL_API Logger final {
 public:
  struct Ports {
    Platform::AppendFiles& appendFiles;
    Platform::Clock& clock;
    Platform::PrivateFiles& privateFiles;
    Platform::StandardOutput& standardOutput;
    Platform::TimeZones& timeZones;
    Platform::UserAccount& userAccount;
    Platform::UserLocale& userLocale;
  };

  /// The process's logger, made on first use; it lives as long as the process.
  [[nodiscard]] static Logger& instance();

  /// A logger of one's own; `baseIdentifier` names the folder of its files. The ports must outlive
  /// it. Destruction writes what has gathered; nobody may be logging meanwhile.
  Logger(Ports ports, std::string_view baseIdentifier);
  Logger(const Platform::Ports& ports, std::string_view baseIdentifier);
  ~Logger();
  Logger(const Logger&) = delete;
  Logger& operator=(const Logger&) = delete;

  /// Writes one entry.
  void log(std::string_view message, std::string_view author = {},
           const LoggingContextTags& tags = {}, SourcePosition where = SourcePosition::current());
  void log(std::string_view message, std::string_view author,
           const std::optional<Platform::URL>& location,
           SourcePosition where = SourcePosition::current());
  void log(std::string_view message, const std::optional<Platform::URL>& location,
           SourcePosition where = SourcePosition::current());

  /// Writes an entry of an error: its type, its description, and on a line below the caller's place
  /// in the source code.
  void logError(const LoggedError& error, std::string_view author = {},
                const LoggingContextTags& tags = {},
                SourcePosition where = SourcePosition::current());
  void logError(const LoggedError& error, std::string_view author,
                std::optional<std::string_view> jobDescription,
                const std::optional<Platform::URL>& location = std::nullopt,
                SourcePosition where = SourcePosition::current());

  /// Writes what has gathered to the file now and waits for the disk: before a deliberate crash,
  /// say.
  void flush();

  /// The log file; absent when its folder could not be made.
  [[nodiscard]] std::optional<Platform::URL> logFileURL() const;

  /// Whether the texts below hide paths and exact sizes. False at first.
  [[nodiscard]] bool isAnonymousMode() const { return isAnonymousMode_; }
  void setIsAnonymousMode(bool isAnonymous) { isAnonymousMode_ = isAnonymous; }

  // The forms in which sizes, timings and locations enter messages. Sizes are in bytes.
  [[nodiscard]] std::string stringForFileSize(std::int64_t size) const;
  [[nodiscard]] std::string stringForMemorySize(std::int64_t size) const;
  [[nodiscard]] std::string stringForByteCount(std::int64_t count,
                                               Platform::ByteCountStyle countStyle) const;
  /// "undefined" for an interval that has no text.
  [[nodiscard]] std::string stringForTiming(Platform::TimeInterval interval) const;
  [[nodiscard]] std::string stringForTiming(Platform::Date startData, Platform::Date endDate) const;
  /// The time from the date until now.
  [[nodiscard]] std::string stringForTiming(Platform::Date fromDate) const;
  /// The path; in anonymous mode "directory" or the extension alone, "[*.jpg]", and nothing for a
  /// file without one. Anonymous mode asks the file system whether the URL is a folder.
  [[nodiscard]] std::optional<std::string> stringForFileURL(const Platform::URL& url) const;

  // Configuration that no operation reads: entries are neither padded nor folded.
  [[nodiscard]] static constexpr int authorFoldingLength() { return 24; }
  [[nodiscard]] static constexpr int messageWithCodeLocationFoldingLength() { return 60; }
  [[nodiscard]] static constexpr std::string_view foldingCharacter() { return " "; }
  /// Starts each further line of an entry.
  [[nodiscard]] static std::string_view nextLinePrefix();

  // The formatters of entries, file names and timings, in the process's locale.
  [[nodiscard]] static const Platform::DateFormatter& logMessageDateFormatter();
  [[nodiscard]] static const Platform::DateFormatter& fileNameDateFormatter();
  [[nodiscard]] static const Platform::DurationFormatter& timingFormatter();

 private:
  void openFile(std::string_view baseIdentifier);
  void beginAnewInForkedChild();

  Ports ports_;
  std::atomic<bool> isAnonymousMode_ = false;
  Platform::DateFormatter entryDates_;
  Platform::ByteCountFormatter byteCounts_;
  Basalt::FuzzyByteCountFormatter fuzzyByteCounts_;
  std::optional<std::string> filePath_;
  std::unique_ptr<LogFileChannel> fileChannel_;
};

}  // namespace Varnel
