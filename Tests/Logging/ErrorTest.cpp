// SPDX-License-Identifier: MIT
#include <Varnel/Logging/Error.h>

#include <exception>
#include <filesystem>
#include <fstream>
#include <future>
#include <ios>
#include <stdexcept>

#include <gtest/gtest.h>

#include <Varnel/Basalt/JSON.h>
#include <Varnel/Context/Globals.h>
#include <Varnel/Logging/CustomLogStringConvertible.h>
#include <Varnel/Logging/ErrorBridging.h>
#include <Varnel/Logging/GenericError.h>
#include <Varnel/Logging/LoggedError.h>
#include <Varnel/Logging/UserErrorType.h>

namespace Host {
struct ImportFailure : std::runtime_error {
  using std::runtime_error::runtime_error;
};
struct NestsNothing : std::runtime_error, std::nested_exception {
  using std::runtime_error::runtime_error;
};
}  // namespace Host

struct BareFailure : std::runtime_error {
  using std::runtime_error::runtime_error;
};

namespace Varnel {
namespace {

using Platform::PlatformError;

class ScanError : public UserErrorType {
 public:
  explicit ScanError(std::optional<UserErrorInfo> info = {}) : info_(std::move(info)) {}
  std::string_view typeName() const override { return "ScanError"; }
  std::string domain() const override { return "Host.ScanError"; }
  long code() const override { return 3; }
  std::optional<UserErrorInfo> userErrorInfo() const override { return info_; }

 private:
  std::optional<UserErrorInfo> info_;
};

class ThrownError final : public Error,
                          public std::out_of_range,
                          public LogsItsDescription<ThrownError> {
 public:
  ThrownError() : std::out_of_range("what") {}
  std::string_view typeName() const override { return "ThrownError"; }
  long code() const override { return 1; }
  std::string description() const override { return "described"; }
};

/// What is caught when the second error is thrown while the first is handled.
LoggedError nested(const auto& first, const auto& second) {
  try {
    try {
      throw first;
    } catch (...) {
      std::throw_with_nested(second);
    }
  } catch (const std::exception& exception) {
    return exception;
  }
}

LoggedError streamFailure() {
  try {
    std::ifstream stream;
    stream.exceptions(std::ios::failbit);
    stream.open("/nowhere");
  } catch (const std::exception& exception) {
    return exception;
  }
  return std::exception();
}

TEST(LoggedError, DescribesWhateverWasCaught) {
  struct Row {
    LoggedError error;
    std::string typeName;
    std::string logDescription;
    std::string description;
  };
  const ThrownError thrown;
  const std::string& application = Globals::applicationName();
  const std::string scanText =
      "Error Domain=Host.ScanError Code=3 \"The operation couldn’t be completed. "
      "(Host.ScanError error 3.)\"";
  const Row rows[] = {
      {GenericError::fallback, "GenericError",
       "Did fail to catch specifi error. Falling back to generic error.", "fallback"},
      {ScanError(), "ScanError", "NSError: " + scanText, scanText},
      {static_cast<const std::exception&>(thrown), "ThrownError", "described", "described"},
      {Host::ImportFailure("no header\n"), "ImportFailure",
       "NSError: Error Domain=Host.ImportFailure Code=0 \"no header\\n\"", "no header\n"},
      {Basalt::JSONError::missingValue("Period", "kind"), "JSONError",
       "NSError: Error Domain=Basalt.JSONError Code=1 \"Unable to import Period at kind: no "
       "value\"",
       "Unable to import Period at kind: no value"},
      {streamFailure(), "failure",
       "NSError: Error Domain=iostream Code=1 \"basic_ios::clear: iostream error\"",
       "basic_ios::clear: iostream error"},
      {nested(BareFailure("disk full"), Host::ImportFailure("no import")), "ImportFailure",
       "NSError: Error Domain=Host.ImportFailure Code=0 \"no import\" "
       "UserInfo={NSUnderlyingError={Error Domain=" +
           application + ".BareFailure Code=0 \"disk full\"}}",
       "no import"},
      {nested(GenericError::fallback, std::system_error(std::make_error_code(std::errc::io_error))),
       "system_error",
       "NSError: Error Domain=generic Code=5 \"Input/output error\" "
       "UserInfo={NSUnderlyingError={Error Domain=Varnel.GenericError Code=0 "
       "\"The operation couldn’t be completed. (Varnel.GenericError error 0.)\"}}",
       "Input/output error"},
      {nested(7, BareFailure("x")), "BareFailure",
       "NSError: Error Domain=" + application + ".BareFailure Code=0 \"x\"", "x"},
      {Host::NestsNothing("x"), "NestsNothing",
       "NSError: Error Domain=Host.NestsNothing Code=0 \"x\"", "x"},
      {std::exception(), "exception",
       "NSError: Error Domain=std.exception Code=0 \"std::exception\"", "std::exception"},
      {std::make_error_code(std::errc::no_space_on_device), "error_code",
       "NSError: Error Domain=generic Code=28 \"No space left on device\"",
       "Error Domain=generic Code=28 \"No space left on device\""},
  };
  for (const Row& row : rows) {
    EXPECT_EQ(row.error.typeName(), row.typeName);
    EXPECT_EQ(row.error.logDescription(), row.logDescription) << row.typeName;
    EXPECT_EQ(row.error.description(), row.description) << row.typeName;
  }
}

TEST(ErrorBridging, KeepsTheCodeOfAnExceptionThatHasOne) {
  const auto denied = std::make_error_code(std::errc::permission_denied);
  const PlatformError file = platformError(std::filesystem::filesystem_error("open", "/a", denied));
  EXPECT_EQ(file.domain(), "generic");
  EXPECT_EQ(file.code(), 13);
  EXPECT_NE(file.localizedDescription().find("/a"), std::string::npos);
  EXPECT_EQ(platformError(std::ios_base::failure("x", std::io_errc::stream)).domain(), "iostream");
  EXPECT_EQ(platformError(std::future_error(std::future_errc::no_state)).code(),
            static_cast<long>(std::future_errc::no_state));
  EXPECT_EQ(LoggedError(std::filesystem::filesystem_error("open", denied)).typeName(),
            "filesystem_error");
  EXPECT_EQ(platformError(static_cast<const std::exception&>(ThrownError())).domain(),
            "Varnel.ThrownError");
}

TEST(UserErrorType, HasAnErrorForTheUserOnlyWithTexts) {
  EXPECT_EQ(ScanError().userError(), std::nullopt);

  const UserErrorInfo info("It is gone.", "Choose another.", {"OK", "Retry"},
                           {{"NSLocalizedDescription", std::string("loses")}, {"extra", 7}});
  const PlatformError error = ScanError(info).userError().value();
  EXPECT_EQ(error.description(), "Error Domain=Host.ScanError Code=3 \"It is gone.\"");
  EXPECT_EQ(std::any_cast<std::string>(error.userInfo().at("NSLocalizedRecoverySuggestion")),
            "Choose another.");
  EXPECT_EQ(
      std::any_cast<std::vector<std::string>>(error.userInfo().at("NSLocalizedRecoveryOptions")),
      (std::vector<std::string>{"OK", "Retry"}));
  EXPECT_EQ(std::any_cast<int>(error.userInfo().at("extra")), 7);
}

}  // namespace
}  // namespace Varnel
