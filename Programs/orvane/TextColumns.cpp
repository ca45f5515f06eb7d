// SPDX-License-Identifier: MIT
#include <orvane/TextColumns.h>

#include <cstdint>

namespace Orvane {
namespace {

constexpr std::string_view gap = "...";

bool continues(char byte) {
  return (static_cast<unsigned char>(byte) & 0xC0) == 0x80;
}

std::uint32_t scalarOf(std::string_view character) {
  const auto lead = static_cast<unsigned char>(character[0]);
  if (character.size() == 1) return lead;
  std::uint32_t scalar = lead & (0x7Fu >> character.size());
  for (const char byte : character.substr(1))
    scalar = scalar << 6 | (static_cast<unsigned char>(byte) & 0x3Fu);
  return scalar;
}

bool isMark(std::uint32_t scalar) {
  return (scalar >= 0x300 && scalar <= 0x36F) || (scalar >= 0x1AB0 && scalar <= 0x1AFF) ||
         (scalar >= 0x20D0 && scalar <= 0x20FF) || (scalar >= 0xFE00 && scalar <= 0xFE0F) ||
         scalar == 0x200D;
}

bool isWide(std::uint32_t scalar) {
  return (scalar >= 0x1100 && scalar <= 0x115F) || (scalar >= 0x2E80 && scalar <= 0xA4CF) ||
         (scalar >= 0xAC00 && scalar <= 0xD7A3) || (scalar >= 0xF900 && scalar <= 0xFAFF) ||
         (scalar >= 0xFE30 && scalar <= 0xFE6F) || (scalar >= 0xFF00 && scalar <= 0xFF60) ||
         (scalar >= 0xFFE0 && scalar <= 0xFFE6) || (scalar >= 0x1F300 && scalar <= 0x1FAFF) ||
         (scalar >= 0x20000 && scalar <= 0x3FFFD);
}

std::size_t lengthOfFirst(std::string_view text) {
  std::size_t length = 1;
  while (length < text.size() && length < 4 && continues(text[length])) ++length;
  return length;
}

std::size_t columnsOfCharacter(std::string_view character) {
  const std::uint32_t scalar = scalarOf(character);
  return isMark(scalar) ? 0 : isWide(scalar) ? 2 : 1;
}

/// As many bytes from the beginning as take no more columns than these.
std::size_t lengthWithin(std::string_view text, std::size_t columns) {
  std::size_t length = 0;
  while (length < text.size()) {
    const std::size_t next = lengthOfFirst(text.substr(length));
    const std::size_t width = columnsOfCharacter(text.substr(length, next));
    if (width > columns) break;
    columns -= width;
    length += next;
  }
  return length;
}

}  // namespace

std::size_t columnsOf(std::string_view text) {
  std::size_t columns = 0;
  while (!text.empty()) {
    const std::size_t length = lengthOfFirst(text);
    columns += columnsOfCharacter(text.substr(0, length));
    text.remove_prefix(length);
  }
  return columns;
}

std::string fitted(std::string_view text, std::size_t maxColumns) {
  std::size_t columns = columnsOf(text);
  if (columns <= maxColumns) return std::string(text);
  if (maxColumns <= gap.size()) return std::string(gap.substr(0, maxColumns));
  const std::size_t room = maxColumns - gap.size();
  const std::string_view head = text.substr(0, lengthWithin(text, room / 3));
  std::string_view tail = text;
  while (columns > room - columnsOf(head)) {
    const std::size_t length = lengthOfFirst(tail);
    columns -= columnsOfCharacter(tail.substr(0, length));
    tail.remove_prefix(length);
  }
  return std::string(head).append(gap).append(tail);
}

std::string padded(std::string text, std::size_t columns) {
  const std::size_t taken = columnsOf(text);
  if (taken < columns) text.append(columns - taken, ' ');
  return text;
}

}  // namespace Orvane
