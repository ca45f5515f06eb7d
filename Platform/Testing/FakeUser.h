// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <vector>

#include <Varnel/Platform/Ports/UserAccount.h>
#include <Varnel/Platform/Ports/UserLocale.h>
#include <Varnel/Platform/Values/PathComponents.h>

namespace Varnel::Platform::Testing {

/// A user account whose facts the test sets. Set them before other threads read.
///
///     FakeUserAccount user;
///     user.home = temporaryFolder;  // what "~" stands for; `realHome` is the one on record
class FakeUserAccount final : public UserAccount {
 public:
  std::string home = "/home/ada";
  std::string realHome = "/home/ada";
  std::string accountName = "ada";

  [[nodiscard]] std::string homeFolder() const override {
    return joinPathComponents(pathComponents(home.starts_with('/') ? home : realHome));
  }
  [[nodiscard]] std::string realHomeFolder() const override { return realHome; }
  [[nodiscard]] std::string name() const override { return accountName; }
};

/// A user's language and formats as the test sets them; an empty one was not chosen. Set them
/// before other threads read.
class FakeUserLocale final : public UserLocale {
 public:
  std::vector<std::string> languageTags = {"en-US"};
  std::string localeIdentifier = "en_US";
  std::string numberLocaleIdentifier = "en_US";

  [[nodiscard]] std::vector<std::string> languages() const override {
    return languageTags.empty() ? std::vector<std::string>{"en"} : languageTags;
  }
  [[nodiscard]] std::string identifier() const override { return chosen(localeIdentifier); }
  [[nodiscard]] std::string numberIdentifier() const override {
    return chosen(numberLocaleIdentifier);
  }

 private:
  static std::string chosen(const std::string& identifier) {
    return identifier.empty() ? "en_US" : identifier;
  }
};

}  // namespace Varnel::Platform::Testing
