// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Generic/SoundKind.h>

#include <algorithm>
#include <cstddef>
#include <iterator>

namespace Varnel::Platform {
namespace {

struct Mark {
  std::size_t position;
  std::string_view text;
  std::size_t secondPosition = 0;
  std::string_view secondText = {};
};

constexpr Mark marks[] = {
    {4, "ftyp"},              // M4A and its family
    {0, "FORM", 8, "AIF"},    // AIFF, plain and compressed
    {0, "RIFF", 8, "WAVE"},   //
    {0, "OggS"},              //
    {0, "fLaC"},              //
    {0, "caff"},              //
    {0, ".snd"},              //
    {0, "\x1a\x45\xdf\xa3"},  // Matroska
    {0, "ID3"},               // MP3 with tags
};

// A frame of MP3 or of bare AAC begins with eleven set bits.
bool beginsWithFrame(std::string_view bytes) {
  return bytes.size() >= 2 && bytes[0] == '\xff' && (bytes[1] & '\xe0') == '\xe0';
}

}  // namespace

bool looksLikeSound(std::string_view bytes) {
  const auto has = [bytes](std::size_t position, std::string_view text) {
    return bytes.size() >= position && bytes.substr(position).starts_with(text);
  };
  return beginsWithFrame(bytes) ||
         std::any_of(std::begin(marks), std::end(marks), [&](const Mark& mark) {
           return has(mark.position, mark.text) && has(mark.secondPosition, mark.secondText);
         });
}

}  // namespace Varnel::Platform
