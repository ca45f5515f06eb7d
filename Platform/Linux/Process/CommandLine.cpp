// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Linux/Process/CommandLine.h>

#include <glib.h>

#include <algorithm>
#include <deque>
#include <string_view>

#include <Varnel/Platform/Values/UniqueHandle.h>

namespace Varnel::Platform::Linux {
namespace {

using Words = std::deque<std::string>;
using Strings = UniqueHandle<char**, g_strfreev>;

std::optional<Words> split(const std::string& line) {
  int count = 0;
  char** found = nullptr;
  if (!g_shell_parse_argv(line.c_str(), &count, &found, nullptr)) return std::nullopt;
  const Strings words(found);
  return Words(words.get(), words.get() + count);
}

// The word with its field codes replaced: "%%" by a percent sign, the others by nothing.
std::optional<std::string> expanded(std::string_view word) {
  constexpr std::string_view codes = "fFuUickdDnNvm";
  std::string text;
  for (std::size_t i = 0; i < word.size(); ++i) {
    if (word[i] != '%') {
      text += word[i];
      continue;
    }
    if (++i == word.size()) return std::nullopt;
    if (word[i] == '%')
      text += '%';
    else if (codes.find(word[i]) == std::string_view::npos)
      return std::nullopt;
  }
  return text;
}

std::optional<Words> expanded(const Words& words) {
  Words result;
  for (const std::string& word : words) {
    auto text = expanded(word);
    if (!text) return std::nullopt;
    // A word that is only a field code vanishes with the code.
    if (!text->empty() || word.empty()) result.push_back(std::move(*text));
  }
  return result;
}

bool isEnv(std::string_view program) {
  return program.substr(program.rfind('/') + 1) == "env";
}

struct EnvOption {
  char letter;
  std::string_view name;
};

// The options that take a value, which may be the next word.
constexpr EnvOption optionsWithValue[] = {
    {'a', "--argv0"}, {'C', "--chdir"}, {'S', "--split-string"}, {'u', "--unset"}};

// The letter of the option in the first word, if it takes a value; `value` is the part of the value
// that stands in the same word. Letters may share a dash, and names may be shortened.
char optionIn(std::string_view word, std::optional<std::string>& value) {
  if (word.starts_with("--")) {
    const std::size_t mark = word.find('=');
    for (const EnvOption& option : optionsWithValue) {
      if (!option.name.starts_with(word.substr(0, mark))) continue;
      if (mark != std::string_view::npos) value = word.substr(mark + 1);
      return option.letter;
    }
    return 0;
  }
  for (std::size_t i = 1; i < word.size(); ++i)
    for (const EnvOption& option : optionsWithValue) {
      if (option.letter != word[i]) continue;
      if (i + 1 < word.size()) value = word.substr(i + 1);
      return option.letter;
    }
  return 0;
}

// Removes the options of "env". False when they are malformed.
bool skipOptions(Words& words) {
  while (!words.empty() && words.front().starts_with('-')) {
    std::optional<std::string> value;
    const std::string word = words.front();
    words.pop_front();
    if (word == "--") return true;
    const char letter = optionIn(word, value);
    if (letter == 0) continue;
    if (!value) {
      if (words.empty()) return false;
      value = words.front();
      words.pop_front();
    }
    if (letter != 'S') continue;
    // Its value stands for words in its place, options included.
    const auto more = split(*value);
    if (!more) return false;
    words.insert(words.begin(), more->begin(), more->end());
  }
  return true;
}

}  // namespace

std::optional<std::string> programOf(const std::string& commandLine) {
  const auto raw = split(commandLine);
  auto words = raw ? expanded(*raw) : std::nullopt;
  if (!words) return std::nullopt;
  while (!words->empty() && isEnv(words->front())) {
    words->pop_front();
    if (!skipOptions(*words)) return std::nullopt;
    while (!words->empty() && words->front().find('=') != std::string::npos) words->pop_front();
  }
  if (words->empty() || words->front().empty()) return std::nullopt;
  return std::move(words->front());
}

}  // namespace Varnel::Platform::Linux
