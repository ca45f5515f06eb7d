// SPDX-License-Identifier: MIT
#include <orvane/Arguments.h>

#include <getopt.h>

#include <algorithm>
#include <utility>

namespace Orvane {
namespace {

/// What the C library's parser wants.
class Words final {
 public:
  Words(const std::vector<Option>& options, std::vector<std::string> arguments, char order)
      : arguments_(std::move(arguments)) {
    words_.push_back(program_);
    for (std::string& argument : arguments_) words_.push_back(argument.data());
    words_.push_back(nullptr);
    letters_ = {order, ':'};
    for (std::size_t i = 0; i < options.size(); ++i) {
      const bool hasValue = !options[i].value.name.empty();
      forms_.push_back({options[i].name.c_str(), hasValue ? required_argument : no_argument,
                        nullptr, firstNumber + static_cast<int>(i)});
      if (options[i].letter != 0) letters_ += options[i].letter + std::string(hasValue ? ":" : "");
    }
    forms_.push_back({});
    optind = 0;  // Starts anew.
    opterr = 0;
  }
  Words(const Words&) = delete;
  Words& operator=(const Words&) = delete;

  /// An option's number or letter, 1 for an operand, '?', ':' or -1, as the library has it.
  [[nodiscard]] int next() {
    const int last = static_cast<int>(words_.size()) - 1;
    return ::getopt_long(last, words_.data(), letters_.c_str(), forms_.data(), nullptr);
  }

  [[nodiscard]] std::string current() const { return words_[static_cast<std::size_t>(optind) - 1]; }
  /// How many arguments are done with.
  [[nodiscard]] std::size_t count() const { return static_cast<std::size_t>(optind) - 1; }
  [[nodiscard]] std::vector<std::string> rest() const {
    return {words_.begin() + optind, words_.end() - 1};
  }

  static constexpr int firstNumber = 256;  ///< Above all letters.

 private:
  char program_[7] = "orvane";
  std::vector<std::string> arguments_;
  std::vector<char*> words_;
  std::string letters_;
  std::vector<::option> forms_;
};

const Option* optionOf(const std::vector<Option>& options, int code) {
  if (code >= Words::firstNumber)
    return &options[static_cast<std::size_t>(code - Words::firstNumber)];
  const auto found = std::find_if(options.begin(), options.end(),
                                  [&](const auto& option) { return option.letter == code; });
  return found == options.end() || code == 0 ? nullptr : &*found;
}

std::string complaintAbout(const std::vector<Option>& options, int code, const Words& words) {
  const Option* const option = optionOf(options, optopt);
  if (code == ':') return "--" + option->name + " lacks its " + option->value.name;
  if (option) return "--" + option->name + " takes no value";
  // The library names an unknown letter, and no unknown word.
  const std::string name =
      optopt != 0 ? std::string("-") + static_cast<char>(optopt) : words.current();
  return "there is no option " + name;
}

/// Takes what the words hold.
class Taker final {
 public:
  Taker(const std::vector<Option>& options, const Operands& operands, Words& words)
      : options_(options), operands_(operands), words_(words), isGiven_(options.size()) {}

  TakenArguments run() {
    for (int code; !taken_.wrong && (code = words_.next()) != -1;) {
      if (code == '?' || code == ':') {
        taken_.wrong = complaintAbout(options_, code, words_);
      } else if (code == 1) {
        takeOperand(optarg);
      } else {
        takeOption(*optionOf(options_, code));
      }
    }
    taken_.count = words_.count();
    return taken_;
  }

  TakenArguments runToTheEnd() {
    run();
    for (const std::string& operand : words_.rest())
      if (!taken_.wrong) takeOperand(operand);
    bool needsOperands = operandCount_ < operands_.min;
    for (std::size_t i = 0; i < options_.size(); ++i) {
      if (options_[i].isRequired && !isGiven_[i])
        taken_.missing = "--" + options_[i].name + " is missing";
      if (options_[i].standsForOperands && isGiven_[i]) needsOperands = false;
    }
    if (needsOperands) taken_.missing = "a " + operands_.value.name + " is missing";
    return taken_;
  }

 private:
  void takeOption(const Option& option) {
    isGiven_[static_cast<std::size_t>(&option - options_.data())] = true;
    if (const auto complaint = option.value.take(optarg == nullptr ? "" : optarg))
      taken_.wrong = "--" + option.name + ": " + *complaint;
  }

  void takeOperand(const std::string& operand) {
    if (++operandCount_ > operands_.max) {
      taken_.wrong = "\"" + operand + "\" is one argument too many";
    } else {
      taken_.wrong = operands_.value.take(operand);
    }
  }

  const std::vector<Option>& options_;
  const Operands& operands_;
  Words& words_;
  std::vector<bool> isGiven_;
  std::size_t operandCount_ = 0;
  TakenArguments taken_;
};

}  // namespace

TakenArguments takeArguments(const std::vector<Option>& options, const Operands& operands,
                             std::vector<std::string> arguments) {
  Words words(options, std::move(arguments), '-');
  return Taker(options, operands, words).runToTheEnd();
}

TakenArguments takeLeadingOptions(const std::vector<Option>& options,
                                  std::vector<std::string> arguments) {
  Words words(options, std::move(arguments), '+');
  const Operands none;
  return Taker(options, none, words).run();
}

}  // namespace Orvane
