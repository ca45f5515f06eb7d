// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Text/PropertyListGuard.h>

#include <algorithm>
#include <bit>
#include <cmath>
#include <cstddef>
#include <cstdint>
#include <vector>

#include <Varnel/Platform/Text/PropertyListScalars.h>

namespace Varnel::Platform {
namespace {

constexpr std::size_t maxDepth = 512;

/// What a parse may cost, one unit being about a byte of memory or ten nanoseconds.
class Budget final {
 public:
  [[nodiscard]] bool spend(std::uint64_t cost) {
    if (cost > left_) return false;
    left_ -= cost;
    return true;
  }

  [[nodiscard]] bool spendNode() { return spend(64); }

 private:
  std::uint64_t left_ = std::uint64_t{1} << 27;
};

/// Follows the tags of an XML text and ignores their meaning. Its depth is never less than the
/// parser's.
class XMLGuard final {
 public:
  explicit XMLGuard(std::string_view bytes) : bytes_(bytes) {}

  [[nodiscard]] bool isTame() {
    while (takeText())
      if (!takeMarkup(bytes_.substr(position_))) return false;
    return budget_.spend(textCost());
  }

 private:
  // False at the end of the bytes, else markup follows.
  [[nodiscard]] bool takeText() {
    const std::string_view rest = bytes_.substr(position_);
    const std::string_view text = rest.substr(0, rest.find('<'));
    textLength_ += text.size();
    entityCount_ += static_cast<std::uint64_t>(std::count(text.begin(), text.end(), '&'));
    position_ += text.size();
    return position_ < bytes_.size();
  }

  [[nodiscard]] bool takeMarkup(std::string_view rest) {
    if (rest.starts_with("<!--")) return skipPast("-->", 4);
    if (rest.starts_with("<![CDATA[")) return skipPast("]]>", 9);
    const std::size_t length = tagLength(rest);
    position_ += length;
    return length != 0 && takeTag(rest.substr(0, length));
  }

  // Neither of these ends a text, which may consist of pieces between comments.
  [[nodiscard]] bool skipPast(std::string_view end, std::size_t prefixLength) {
    const std::size_t found = bytes_.find(end, position_ + prefixLength);
    if (found == std::string_view::npos) return false;
    textLength_ += found - position_;
    position_ = found + end.size();
    return true;
  }

  // Zero where readers could disagree on the tag's end: when it has brackets within quotes, or no
  // end.
  static std::size_t tagLength(std::string_view rest) {
    char quote = 0;
    for (std::size_t index = 1; index < rest.size(); ++index) {
      const char character = rest[index];
      if (character == '<') return 0;
      if (character == '>') return quote ? 0 : index + 1;
      if (quote) {
        if (character == quote) quote = 0;
      } else if (character == '"' || character == '\'') {
        quote = character;
      }
    }
    return 0;
  }

  [[nodiscard]] bool takeTag(std::string_view tag) {
    if (!budget_.spend(textCost()) || !budget_.spendNode()) return false;
    textLength_ = entityCount_ = 0;
    if (tag.starts_with("<?")) return tag.size() > 3 && tag.ends_with("?>");
    if (tag.starts_with("<!")) return tag.find('[') == std::string_view::npos;
    if (tag.starts_with("</")) return close(tag);
    if (tag.starts_with("<key")) return countKey();
    const std::string_view name = nameOf(tag.substr(1));
    if (name == "integer") return isValue(tag, name, isWholeNumber);
    if (name == "real") return isValue(tag, name, isReal);
    if (name == "date") return isValue(tag, name, isDate);
    if (!tag.starts_with("<dict") && !tag.starts_with("<array")) return true;
    if (!tag.ends_with("/>")) keyCounts_.push_back(0);
    return keyCounts_.size() <= maxDepth;
  }

  [[nodiscard]] bool close(std::string_view tag) {
    const std::string_view name = nameOf(tag.substr(2));
    if (name != "dict" && name != "array") return true;
    if (keyCounts_.empty()) return false;
    keyCounts_.pop_back();
    return true;
  }

  // At `position_`, behind the tag, stands the element's text and then nothing but its end.
  [[nodiscard]] bool isValue(std::string_view tag, std::string_view name,
                             bool (*isWhole)(std::string_view)) const {
    const std::string_view rest = bytes_.substr(position_);
    const std::string_view text = rest.substr(0, rest.find('<'));
    const std::string_view end = rest.substr(text.size());
    return !tag.ends_with("/>") && isWhole(text) && end.starts_with("</") &&
           nameOf(end.substr(2)) == name;
  }

  static std::string_view nameOf(std::string_view tag) {
    return tag.substr(0, tag.find_first_of(" \t\r\n/>"));
  }

  // A key is compared with those before it when their hashes collide, and a forger can make them
  // collide.
  [[nodiscard]] bool countKey() { return keyCounts_.empty() || budget_.spend(++keyCounts_.back()); }

  // Replacing an entity moves the rest of its text.
  [[nodiscard]] std::uint64_t textCost() const { return entityCount_ * textLength_ / 256; }

  const std::string_view bytes_;
  std::size_t position_ = 0;
  std::uint64_t textLength_ = 0;
  std::uint64_t entityCount_ = 0;
  std::vector<std::uint64_t> keyCounts_;  ///< Of each dictionary or array that is open.
  Budget budget_;
};

/// Visits the objects of a binary list as the parser will: an object with several references once
/// for each. Cycles exceed the depth, and references that multiply exceed the budget.
class BinaryGuard final {
 public:
  explicit BinaryGuard(std::string_view bytes) : bytes_(bytes) {}

  [[nodiscard]] bool isTame() {
    if (bytes_.size() < trailerSize) return false;
    const std::size_t trailer = bytes_.size() - trailerSize;
    offsetSize_ = number(trailer + 6, 1);
    referenceSize_ = number(trailer + 7, 1);
    objectCount_ = number(trailer + 8, 8);
    table_ = number(trailer + 24, 8);
    if (offsetSize_ - 1 > 7 || referenceSize_ - 1 > 7 || table_ > trailer) return false;
    return objectCount_ <= (trailer - table_) / offsetSize_ && visit(number(trailer + 16, 8), 1);
  }

 private:
  static constexpr std::size_t trailerSize = 32;

  enum Kind : std::uint64_t {
    integer = 0x1,
    date = 0x3,
    data = 0x4,
    ascii = 0x5,
    utf16 = 0x6,
    identifier = 0x8,
    array = 0xA,
    dictionary = 0xD
  };

  // Big-endian; the caller has made sure of the bounds.
  [[nodiscard]] std::uint64_t number(std::size_t offset, std::size_t size) const {
    std::uint64_t value = 0;
    for (const char byte : bytes_.substr(offset, size))
      value = value << 8 | static_cast<unsigned char>(byte);
    return value;
  }

  [[nodiscard]] bool visit(std::uint64_t index, std::size_t depth) {
    if (index >= objectCount_ || depth > maxDepth || !budget_.spendNode()) return false;
    std::size_t position = number(table_ + index * offsetSize_, offsetSize_);
    if (position >= table_) return false;
    const std::uint64_t marker = number(position++, 1);
    const std::uint64_t kind = marker >> 4;
    std::uint64_t count = marker & 0xF;
    if (kind == integer) return count < 4 || (count == 4 && number(position, 8) == 0);
    if (kind == date) return std::isfinite(std::bit_cast<double>(number(position, 8)));
    if (kind == identifier) return count < 8;
    if (kind < data) return true;

    if (count == 0xF) {
      const std::uint64_t exponent = number(position++, 1) - 0x10;
      const std::size_t countSize = std::size_t{1} << (exponent & 3);
      if (exponent > 3 || countSize > bytes_.size() - position) return false;
      count = number(position, countSize);
      position += countSize;
    }
    if (count > bytes_.size()) return false;
    switch (kind) {
      case data:
        return budget_.spend(count);
      case ascii:
        return visitText(position, count, 1);
      case utf16:
        return visitText(position, count, 2);
      case array:
        return visitAll(position, count, depth);
      // For keys the worst case is assumed: each one is compared with all before it.
      case dictionary:
        return budget_.spend(count * count / 2) && visitAll(position, count * 2, depth);
      default:
        return false;
    }
  }

  // The parser cuts texts off at a zero character, or aborts over one in a key.
  [[nodiscard]] bool visitText(std::size_t position, std::uint64_t count, std::size_t unitSize) {
    if (count > (bytes_.size() - position) / unitSize || !budget_.spend(count * unitSize))
      return false;
    for (; count > 0; --count, position += unitSize)
      if (number(position, unitSize) == 0) return false;
    return true;
  }

  [[nodiscard]] bool visitAll(std::size_t position, std::uint64_t count, std::size_t depth) {
    if (count > (bytes_.size() - position) / referenceSize_) return false;
    for (; count > 0; --count, position += referenceSize_)
      if (!visit(number(position, referenceSize_), depth + 1)) return false;
    return true;
  }

  const std::string_view bytes_;
  std::size_t offsetSize_ = 0;
  std::size_t referenceSize_ = 0;
  std::uint64_t objectCount_ = 0;
  std::size_t table_ = 0;
  Budget budget_;
};

}  // namespace

bool isTameXML(std::string_view bytes) {
  return XMLGuard(bytes).isTame();
}

bool isTameBinary(std::string_view bytes) {
  return BinaryGuard(bytes).isTame();
}

}  // namespace Varnel::Platform
