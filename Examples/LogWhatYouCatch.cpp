// SPDX-License-Identifier: MIT
// Logs an entry with context, and the errors that a C++ host meets: its own, the system's, any
// exception. The day's file lies in ~/Library/Logs, in the folder of the program's name.
#include <filesystem>
#include <stdexcept>
#include <string>
#include <string_view>

#include <Varnel/Logging/GenericError.h>
#include <Varnel/Logging/Logger.h>
#include <Varnel/Logging/LoggingObject.h>

using Varnel::LoggingContextTag;
using Varnel::Platform::URL;

class Importer final : public Varnel::LoggingObject {
 public:
  std::string_view logAuthor() const override { return "Importer"; }

  void run() const {
    log("Did start", {LoggingContextTag::jobDescription("import"),
                      LoggingContextTag::location(URL::fileURLWithPath("/tmp/photos/"))});
    logError(Varnel::GenericError::fallback);

    std::error_code failed;
    std::filesystem::create_directory("/proc/photos", failed);
    if (failed) logError(failed);

    try {
      (void)std::stoi("not a number");
    } catch (const std::exception& caught) {
      logError(caught);
    }
  }
};

int main() {
  Importer().run();
}
