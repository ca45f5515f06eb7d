// SPDX-License-Identifier: MIT
#include <Varnel/Provenance/KVQuarantine.h>

#include <string_view>
#include <utility>

#include <Varnel/Platform/Ports/ExtendedAttributes.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/SystemLog.h>
#include <Varnel/Platform/Ports/UserAccount.h>
#include <Varnel/Platform/SQLite/SQLiteDatabase.h>
#include <Varnel/Platform/Values/UTF8.h>
#include <Varnel/Provenance/DownloadList.h>

namespace Varnel {
namespace {

using Platform::SQLiteStatement;
using Platform::URL;

constexpr std::string_view databasesBelowHome =
    "/Library/Preferences/com.apple.LaunchServices.QuarantineEvents";
constexpr const char* attributeName = "com.apple.quarantine";

constexpr int eventIdentifierColumn = 0;
constexpr int dataURLColumn = 4;

std::vector<std::string> split(std::string_view text, char separator) {
  std::vector<std::string> pieces;
  while (true) {
    const std::size_t end = text.find(separator);
    pieces.emplace_back(text.substr(0, end));
    if (end == std::string_view::npos) return pieces;
    text.remove_prefix(end + 1);
  }
}

std::optional<std::string_view> textIn(SQLiteStatement& row, int column) {
  const auto bytes = row.text(column);
  if (!bytes || !Platform::isValidUTF8(*bytes)) return std::nullopt;
  return bytes;
}

}  // namespace

KVQuarantine::KVQuarantine(std::string path, Platform::SystemLog& systemLog)
    : path_(std::move(path)), systemLog_(systemLog) {}

KVQuarantine::KVQuarantine(std::string path)
    : KVQuarantine(std::move(path), Platform::processPorts().systemLog) {}

std::shared_ptr<KVQuarantine> KVQuarantine::systemQuarantine() {
  return std::make_shared<KVQuarantine>(systemQuarantinePathV2());
}

std::string KVQuarantine::systemQuarantinePath(const Platform::UserAccount& account) {
  return account.homeFolder() + std::string(databasesBelowHome);
}
std::string KVQuarantine::systemQuarantinePath() {
  return systemQuarantinePath(Platform::processPorts().userAccount);
}

std::string KVQuarantine::systemQuarantinePathV2(const Platform::UserAccount& account) {
  return systemQuarantinePath(account) + "V2";
}
std::string KVQuarantine::systemQuarantinePathV2() {
  return systemQuarantinePathV2(Platform::processPorts().userAccount);
}

std::vector<URL> KVQuarantine::downloadsLogsURLs(const Platform::UserAccount& account) {
  return {URL::fileURLWithPath(systemQuarantinePathV2(account)),
          URL::fileURLWithPath(systemQuarantinePath(account))};
}
std::vector<URL> KVQuarantine::downloadsLogsURLs() {
  return downloadsLogsURLs(Platform::processPorts().userAccount);
}

std::optional<std::vector<std::string>> KVQuarantine::quarantineXATTRsForPath(
    const std::string& path, Platform::ExtendedAttributes& attributes) {
  const auto value = attributes.value(path, attributeName);
  if (!value || !*value || !Platform::isValidUTF8(**value)) return std::nullopt;
  return split(**value, ';');
}
std::optional<std::vector<std::string>> KVQuarantine::quarantineXATTRsForPath(
    const std::string& path) {
  return quarantineXATTRsForPath(path, Platform::processPorts().extendedAttributes);
}

std::vector<KVQuarantineEntry> KVQuarantine::entries() const {
  auto database = Platform::SQLiteDatabase::open(path_);
  if (!database) {
    systemLog_.write("Failed to open database!");
    return {};
  }
  auto rows = database->prepare("SELECT * FROM LSQuarantineEvent");
  if (!rows) return {};
  DownloadList downloads;
  while (true) {
    const auto step = rows->step();
    if (!step || *step == SQLiteStatement::Step::done) return downloads.take();
    const auto dataURL = textIn(*rows, dataURLColumn);
    if (dataURL) downloads.add(textIn(*rows, eventIdentifierColumn).value_or(""), *dataURL);
  }
}

}  // namespace Varnel
