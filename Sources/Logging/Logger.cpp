// SPDX-License-Identifier: MIT
#include <Varnel/Logging/Logger.h>

#include <array>
#include <cstdlib>
#include <filesystem>
#include <system_error>
#include <vector>

#include <fmt/format.h>

#include <Varnel/Context/Globals.h>
#include <Varnel/Logging/LogEntry.h>
#include <Varnel/Logging/LogFileChannel.h>
#include <Varnel/Platform/Concurrency/ForkedChild.h>
#include <Varnel/Platform/Ports/AppendFiles.h>
#include <Varnel/Platform/Ports/Clock.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/PrivateFiles.h>
#include <Varnel/Platform/Ports/StandardOutput.h>
#include <Varnel/Platform/Ports/TimeZones.h>
#include <Varnel/Platform/Ports/UserAccount.h>
#include <Varnel/Platform/Ports/UserLocale.h>
#include <Varnel/Platform/Text/VisibleText.h>

namespace Varnel {
namespace {

// The year is that of the week, so that the last days of December may bear the next year's number.
constexpr std::string_view entryDatePattern = "YYYY-MM-dd HH:mm:ss";
constexpr std::string_view fileNameDatePattern = "YYYY-MM-dd";

// Never destroyed, like the process's logger.
const Platform::DateFormatter& makeDateFormatter(std::string_view pattern) {
  const Platform::Ports& ports = Platform::processPorts();
  return *new Platform::DateFormatter(pattern, ports.userLocale.get().identifier(),
                                      ports.timeZones);
}

bool isFolder(const Platform::URL& url) {
  if (url.hasDirectoryPath()) return true;
  std::error_code failed;
  return std::filesystem::is_directory(url.path(), failed);
}

LoggingContextTags locationTags(const std::optional<Platform::URL>& location) {
  if (!location) return {};
  return {LoggingContextTag::location(*location)};
}

}  // namespace

Logger& Logger::instance() {
  static Logger& shared = []() -> Logger& {
    // Never destroyed: threads and destructors may log until the very end.
    static Logger& logger = *new Logger(Platform::processPorts(), Globals::baseIdentifier());
    const auto endGathering = [] {
      if (logger.fileChannel_) logger.fileChannel_->writeThrough();
    };
    std::atexit(endGathering);
    std::at_quick_exit(endGathering);
    // The parent may end at once, as it does where a program goes into the background.
    Platform::callBeforeForks([] {
      if (logger.fileChannel_) logger.fileChannel_->flush();
    });
    Platform::callInForkedChildren([] { logger.beginAnewInForkedChild(); });
    return logger;
  }();
  return shared;
}

Logger::Logger(const Platform::Ports& ports, std::string_view baseIdentifier)
    : Logger({.appendFiles = ports.appendFiles,
              .clock = ports.clock,
              .privateFiles = ports.privateFiles,
              .standardOutput = ports.standardOutput,
              .timeZones = ports.timeZones,
              .userAccount = ports.userAccount,
              .userLocale = ports.userLocale},
             baseIdentifier) {}

Logger::Logger(Ports ports, std::string_view baseIdentifier)
    : ports_(ports),
      entryDates_(entryDatePattern, ports.userLocale.identifier(), ports.timeZones),
      byteCounts_(ports.userLocale.numberIdentifier()),
      fuzzyByteCounts_(ports.userLocale.numberIdentifier()) {
  openFile(baseIdentifier);
}

Logger::~Logger() = default;

void Logger::openFile(std::string_view baseIdentifier) {
  const std::string folder =
      fmt::format("{}/Library/Logs/{}", ports_.userAccount.homeFolder(), baseIdentifier);
  const Platform::DateFormatter fileNameDates(fileNameDatePattern, ports_.userLocale.identifier(),
                                              ports_.timeZones);
  const std::string path =
      fmt::format("{}/{}.log", folder, fileNameDates.string(ports_.clock.now()));

  if (const auto error = ports_.privateFiles.makeFolders(folder)) {
    ports_.standardOutput.print(
        fmt::format("Unable to write log to file {} with error {}\n", path, error->description()));
    ports_.standardOutput.print("Will NOT store log\n");
    return;
  }
  fileChannel_ = std::make_unique<LogFileChannel>(ports_.appendFiles, ports_.standardOutput, path);
  filePath_ = path;
  ports_.standardOutput.print(fmt::format("Will store log at {}\n", path));
}

// The parent writes the gathered entries. The child has neither the parent's thread nor the owners
// of its locks.
void Logger::beginAnewInForkedChild() {
  static auto& ofTheParents = *new std::vector<std::unique_ptr<LogFileChannel>>;
  if (!fileChannel_) return;
  ofTheParents.push_back(std::move(fileChannel_));
  fileChannel_ =
      std::make_unique<LogFileChannel>(ports_.appendFiles, ports_.standardOutput, *filePath_,
                                       LogWritePolicy(), LogFileChannel::Start::withTheFirstEntry);
}

void Logger::log(std::string_view message, std::string_view author, const LoggingContextTags& tags,
                 SourcePosition) {
  std::vector<std::string> items;
  for (const LoggingContextTag& tag : tags)
    if (auto item = tag.text(*this))
      // A file's name must neither control the terminal nor look like an entry of its own.
      items.push_back(Platform::visibleText(*std::move(item), Platform::Backslashes::kept));
  std::array<char, 96> timestamp;  // In any script's digits.
  const std::size_t size = entryDates_.write(ports_.clock.now(), timestamp);
  const LogEntry::Buffer buffer = LogEntry::text({timestamp.data(), size}, author, message, items);
  const std::string_view entry(buffer.data(), buffer.size());
  ports_.standardOutput.print(entry);
  if (fileChannel_) fileChannel_->append(entry);
}

void Logger::log(std::string_view message, std::string_view author,
                 const std::optional<Platform::URL>& location, SourcePosition where) {
  log(message, author, locationTags(location), where);
}

void Logger::log(std::string_view message, const std::optional<Platform::URL>& location,
                 SourcePosition where) {
  log(message, {}, location, where);
}

void Logger::logError(const LoggedError& error, std::string_view author,
                      const LoggingContextTags& tags, SourcePosition where) {
  log(LogEntry::errorMessage(error, where), author, tags, where);
}

void Logger::logError(const LoggedError& error, std::string_view author,
                      std::optional<std::string_view> jobDescription,
                      const std::optional<Platform::URL>& location, SourcePosition where) {
  LoggingContextTags tags;
  if (jobDescription)
    tags.push_back(LoggingContextTag::jobDescription(std::string(*jobDescription)));
  if (location) tags.push_back(LoggingContextTag::location(*location));
  logError(error, author, tags, where);
}

void Logger::flush() {
  if (fileChannel_) fileChannel_->flush();
}

std::optional<Platform::URL> Logger::logFileURL() const {
  if (!filePath_) return std::nullopt;
  return Platform::URL::fileURLWithPath(*filePath_);
}

std::string Logger::stringForFileSize(std::int64_t size) const {
  return stringForByteCount(size, Platform::ByteCountStyle::file);
}

std::string Logger::stringForMemorySize(std::int64_t size) const {
  return stringForByteCount(size, Platform::ByteCountStyle::memory);
}

std::string Logger::stringForByteCount(std::int64_t count,
                                       Platform::ByteCountStyle countStyle) const {
  return isAnonymousMode() ? fuzzyByteCounts_.string(count, countStyle)
                           : byteCounts_.string(count, countStyle);
}

std::string Logger::stringForTiming(Platform::TimeInterval interval) const {
  return timingFormatter().string(interval).value_or("undefined");
}

std::string Logger::stringForTiming(Platform::Date startData, Platform::Date endDate) const {
  return stringForTiming(Platform::intervalBetween(startData, endDate));
}

std::string Logger::stringForTiming(Platform::Date fromDate) const {
  return stringForTiming(fromDate, ports_.clock.now());
}

std::optional<std::string> Logger::stringForFileURL(const Platform::URL& url) const {
  if (!isAnonymousMode()) return url.path();
  if (isFolder(url)) return "directory";
  const std::string extension = url.pathExtension();
  if (extension.empty()) return std::nullopt;
  return fmt::format("[*.{}]", extension);
}

std::string_view Logger::nextLinePrefix() {
  return LogEntry::nextLinePrefix;
}

const Platform::DateFormatter& Logger::logMessageDateFormatter() {
  static const auto& formatter = makeDateFormatter(entryDatePattern);
  return formatter;
}

const Platform::DateFormatter& Logger::fileNameDateFormatter() {
  static const auto& formatter = makeDateFormatter(fileNameDatePattern);
  return formatter;
}

const Platform::DurationFormatter& Logger::timingFormatter() {
  static const auto& formatter = *new Platform::DurationFormatter();
  return formatter;
}

}  // namespace Varnel
