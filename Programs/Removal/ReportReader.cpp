// SPDX-License-Identifier: MIT
#include <charconv>
#include <iterator>
#include <nlohmann/json.hpp>
#include <optional>
#include <string_view>
#include <utility>

#include <Removal/Report.h>
#include <Varnel/Platform/Values/SystemText.h>
#include <Varnel/Platform/Values/URL.h>

// The text is taken as it comes, so that what it says is all there is in memory. What is not known
// of it is passed over: later versions may say more.
namespace Orvane {
namespace {

using Varnel::Platform::Result;
using Varnel::Platform::URL;

constexpr std::uint64_t maxLength = std::uint64_t{4} << 30;
/// Of one text or number; and no path is as long.
constexpr std::uint64_t maxTokenLength = 1 << 20;
constexpr std::size_t maxDepth = 64;
constexpr std::uint64_t version = 1;

/// The bytes of the text, which end where it is too long.
class Bytes final {
 public:
  explicit Bytes(std::istream& text) : buffer_(*text.rdbuf()) {}

  [[nodiscard]] bool isAtEnd() {
    if (length_ - tokenBegin_ > maxTokenLength || length_ > maxLength) isTooLong_ = true;
    return isTooLong_ || buffer_.sgetc() == std::char_traits<char>::eof();
  }
  [[nodiscard]] char current() { return static_cast<char>(buffer_.sgetc()); }
  void advance() {
    buffer_.sbumpc();
    ++length_;
  }
  void beginToken() { tokenBegin_ = length_; }
  [[nodiscard]] bool isTooLong() const { return isTooLong_; }

 private:
  std::streambuf& buffer_;
  std::uint64_t length_ = 0;
  std::uint64_t tokenBegin_ = 0;
  bool isTooLong_ = false;
};

/// Bytes as the parser takes them.
class ByteIterator final {
 public:
  using iterator_category = std::input_iterator_tag;
  using value_type = char;
  using difference_type = std::ptrdiff_t;
  using pointer = const char*;
  using reference = char;

  ByteIterator() = default;
  explicit ByteIterator(Bytes& bytes) : bytes_(&bytes) {}

  char operator*() const { return bytes_->current(); }
  ByteIterator& operator++() {
    bytes_->advance();
    return *this;
  }
  ByteIterator operator++(int) {
    const ByteIterator before = *this;
    bytes_->advance();
    return before;
  }
  bool operator==(const ByteIterator& other) const { return isAtEnd() == other.isAtEnd(); }

 private:
  [[nodiscard]] bool isAtEnd() const { return !bytes_ || bytes_->isAtEnd(); }

  Bytes* bytes_ = nullptr;
};

// As the file system gives paths, so that equal ones are equal texts.
bool isPath(const std::string& path) {
  if (!path.starts_with('/') || Varnel::Platform::isCutShort(path)) return false;
  const std::string closed = path + "/";
  return closed.find("//") == closed.npos && closed.find("/./") == closed.npos &&
         closed.find("/../") == closed.npos;
}

/// "1732249591.123456789".
bool readTime(std::string_view text, ReportFile& file) {
  const char* const end = text.data() + text.size();
  const auto [point, status] = std::from_chars(text.data(), end, file.modified);
  if (status != std::errc() || end - point != 10 || *point != '.' || point[1] == '-') return false;
  const auto [stop, error] = std::from_chars(point + 1, end, file.nanoseconds);
  return error == std::errc() && stop == end;
}

/// Builds the report from what the parser meets. A call that returns false ends the parsing.
class Builder final : public nlohmann::json_sax<nlohmann::json> {
 public:
  explicit Builder(Bytes& bytes) : bytes_(bytes) {}

  Report report;
  std::string problem;

  bool null() override {
    return take([] { return true; });
  }
  bool boolean(bool value) override {
    return takeAny([&] {
      if (isAt(Level::report, "partial")) report.isPartial = value;
      if (isAt(Level::file, "reference")) file().isReference = value;
      return true;
    });
  }
  bool number_integer(number_integer_t) override { return otherNumber(); }
  bool number_float(number_float_t, const string_t&) override { return otherNumber(); }
  bool number_unsigned(number_unsigned_t value) override {
    return take([&] {
      if (isAt(Level::report, "schemaVersion")) {
        hasVersion_ = true;
        if (value != version) return fails("it is of a later version, " + std::to_string(value));
      }
      if (isAt(Level::group, "size")) report.groups.back().size = value;
      if (isAt(Level::file, "inode")) file().inode = value;
      return true;
    });
  }
  bool string(string_t& value) override {
    return take([&] {
      if (isIn(Level::rootURLs)) return takeURL(value, exactRoots_.emplace_back());
      if (isIn(Level::nameURLs)) return takeURL(value, exactNames_.emplace_back());
      if (isAt(Level::file, "url")) return takeURL(value, exactPath_);
      if (isAt(Level::file, "modified")) {
        hasTime_ = readTime(value, file());
        return hasTime_ || fails("\"modified\" has no time");
      }
      if (isIn(Level::roots))
        report.roots.push_back(std::move(value));
      else if (isIn(Level::names))
        file().names.push_back(std::move(value));
      else if (isAt(Level::file, "path"))
        file().path = std::move(value);
      return true;
    });
  }
  bool binary(binary_t&) override { return otherNumber(); }

  bool start_object(std::size_t) override { return start(true); }
  bool start_array(std::size_t) override { return start(false); }
  bool key(string_t& value) override {
    bytes_.beginToken();
    key_ = std::move(value);
    return true;
  }
  bool end_object() override {
    const Level level = levels_.back();
    levels_.pop_back();
    if (level == Level::report) return checkReport();
    return level != Level::file || checkFile();
  }
  bool end_array() override {
    levels_.pop_back();
    return true;
  }

  bool parse_error(std::size_t position, const std::string&,
                   const nlohmann::detail::exception&) override {
    if (bytes_.isTooLong()) return fails("it is too long to be one");
    return fails("byte " + std::to_string(position) +
                 (bytes_.isAtEnd() ? ": it ends too early" : " is not JSON's"));
  }

 private:
  enum class Level { report, roots, rootURLs, groups, group, files, file, names, nameURLs, other };

  [[nodiscard]] bool fails(std::string what) {
    problem = std::move(what);
    return false;
  }
  [[nodiscard]] bool isIn(Level level) const { return levels_.back() == level; }
  [[nodiscard]] bool isAt(Level level, std::string_view key) const {
    return isIn(level) && key_ == key;
  }
  [[nodiscard]] ReportFile& file() { return report.groups.back().files.back(); }

  template <typename Use>
  [[nodiscard]] bool takeAny(const Use& use) {
    bytes_.beginToken();
    return levels_.empty() ? fails("it is no object") : use();
  }
  // What is no boolean. A reference must not be taken for another file.
  template <typename Use>
  [[nodiscard]] bool take(const Use& use) {
    return takeAny([&] {
      return isAt(Level::file, "reference") ? fails("\"reference\" is neither true nor false")
                                            : use();
    });
  }
  // Where a number is known, it is whole and not below 0.
  [[nodiscard]] bool otherNumber() {
    return take([&] {
      return !(isAt(Level::report, "schemaVersion") || isAt(Level::group, "size") ||
               isAt(Level::file, "inode")) ||
             fails("\"" + key_ + "\" has an odd number");
    });
  }

  [[nodiscard]] Level levelBelow(bool isObject) const {
    using enum Level;
    if (levels_.empty()) return report;
    if (isIn(groups) && isObject) return group;
    if (isIn(files) && isObject) return file;
    if (isObject) return other;
    if (isAt(report, "groups")) return groups;
    if (isAt(report, "roots")) return roots;
    if (isAt(report, "rootURLs")) return rootURLs;
    if (isAt(group, "files")) return files;
    if (isAt(file, "names")) return names;
    return isAt(file, "nameURLs") ? nameURLs : other;
  }

  [[nodiscard]] bool start(bool isObject) {
    if ((!isObject || !levels_.empty()) && !take([] { return true; })) return false;
    if (levels_.size() == maxDepth) return fails("it is too deep");
    levels_.push_back(levelBelow(isObject));
    if (isIn(Level::group)) report.groups.emplace_back();
    if (isIn(Level::file)) {
      report.groups.back().files.emplace_back();
      hasTime_ = false;
      exactPath_.clear();
      exactNames_.clear();
    }
    key_.clear();
    return true;
  }

  [[nodiscard]] bool takeURL(const std::string& text, std::string& path) {
    const auto url = URL::fileURLWithAbsoluteString(text);
    if (!url) return fails("a URL is that of no file");
    path = url->path();
    return true;
  }

  // Paths that are not UTF-8 are whole in their URLs alone.
  [[nodiscard]] bool checkReport() {
    if (!exactRoots_.empty()) report.roots = std::move(exactRoots_);
    return hasVersion_ || fails("it has no schemaVersion");
  }

  [[nodiscard]] bool checkFile() {
    if (!exactPath_.empty()) file().path = std::exchange(exactPath_, {});
    if (!exactNames_.empty()) file().names = std::exchange(exactNames_, {});
    if (!isPath(file().path)) return fails("a file has no plain, absolute path");
    for (const std::string& name : file().names)
      if (!isPath(name)) return fails("a name is no plain, absolute path");
    return hasTime_ || fails("a file has no time: " + file().path);
  }

  Bytes& bytes_;
  std::vector<Level> levels_;
  std::string key_;
  bool hasVersion_ = false;
  std::vector<std::string> exactRoots_;
  // Of the file:
  bool hasTime_ = false;
  std::string exactPath_;
  std::vector<std::string> exactNames_;
};

}  // namespace

Result<Report, std::string> readReport(std::istream& text) {
  Bytes bytes(text);
  Builder builder(bytes);
  if (nlohmann::json::sax_parse(ByteIterator(bytes), ByteIterator(), &builder))
    return std::move(builder.report);
  return std::move(builder.problem);
}

}  // namespace Orvane
