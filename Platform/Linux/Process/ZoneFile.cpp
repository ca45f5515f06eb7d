// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Linux/Process/ZoneFile.h>

#include <algorithm>
#include <cstddef>
#include <cstdint>

namespace Varnel::Platform::Linux {
namespace {

constexpr std::size_t headerSize = 44;
constexpr std::size_t typeSize = 6;

std::uint64_t byteAt(std::string_view bytes, std::size_t position) {
  return static_cast<unsigned char>(bytes[position]);
}

// A header and the data that it counts. A file has two blocks; the first is for readers that know
// only times of 32 bits.
class Block final {
 public:
  Block(std::string_view bytes, std::size_t timeSize)
      : bytes_(bytes), isThere_(bytes.size() >= headerSize && bytes.starts_with("TZif")) {
    if (!isThere_) return;
    types_ = headerSize + count(3) * timeSize;
    descriptions_ = types_ + count(3);
    names_ = descriptions_ + count(4) * typeSize;
    end_ = names_ + count(5) + count(2) * (timeSize + 4) + count(1) + count(0);
  }

  bool isWhole() const { return isThere_ && end_ <= bytes_.size(); }
  bool isTheOnlyOne() const { return byteAt(bytes_, 4) < '2'; }
  std::string_view rest() const { return bytes_.substr(end_); }

  bool refersToItself() const {
    if (count(4) == 0 || count(5) == 0 || byteAt(bytes_, names_ + count(5) - 1) != 0) return false;
    for (std::size_t at = types_; at < descriptions_; ++at)
      if (byteAt(bytes_, at) >= count(4)) return false;
    for (std::size_t at = descriptions_; at < names_; at += typeSize)
      if (byteAt(bytes_, at + typeSize - 1) >= count(5)) return false;
    return true;
  }

 private:
  // In the order of the header: two kinds of indicators, leap seconds, changes, types, characters.
  std::uint64_t count(std::size_t number) const {
    std::uint64_t value = 0;
    for (std::size_t at = 20 + number * 4; at < 24 + number * 4; ++at)
      value = value << 8 | byteAt(bytes_, at);
    return value;
  }

  const std::string_view bytes_;
  const bool isThere_;
  std::uint64_t types_ = 0;
  std::uint64_t descriptions_ = 0;
  std::uint64_t names_ = 0;
  std::uint64_t end_ = 0;
};

}  // namespace

bool isWholeZoneFile(std::string_view bytes) {
  const Block first(bytes, 4);
  if (!first.isWhole()) return false;
  if (first.isTheOnlyOne()) return first.refersToItself();
  const Block second(first.rest(), 8);
  if (!second.isWhole() || !second.refersToItself()) return false;
  // The rules for what follows the last change stand between line feeds.
  const std::string_view rules = second.rest();
  return rules.size() >= 2 && rules.front() == '\n' && rules.back() == '\n' &&
         std::count(rules.begin(), rules.end(), '\0') == 0;
}

}  // namespace Varnel::Platform::Linux
