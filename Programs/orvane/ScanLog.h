// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <string>
#include <vector>

#include <Scan/ScanObserver.h>
#include <Varnel/Logging/LoggingObject.h>

namespace Orvane {

class Console;

/// "it vanished".
[[nodiscard]] std::string reasonOf(const Loss& loss);

/// Names in the log all that a scan leaves out, and a few of that to the user.
class ScanLog final : public ScanObserver, public Varnel::LoggingObject {
 public:
  /// The console outlives the object.
  explicit ScanLog(Console& console) : console_(console) {}

  [[nodiscard]] std::string_view logAuthor() const override { return "ScanCommand"; }

  void fileLeftOut(const std::string& path, const Loss& loss) override { leaveOut(path, loss); }
  void folderLeftOut(const std::string& path, const Loss& loss) override {
    leaveOut(path + "/", loss);
  }

  /// Says so at once: such a scan may take long, or for ever.
  void networkEntered(const std::string& folder) override;

  /// Complains of the first ones that were left out, and of the others in one line.
  void complain() const;

 private:
  static constexpr std::size_t maxNamed = 3;

  void leaveOut(const std::string& path, const Loss& loss);

  Console& console_;
  std::vector<LostPath> first_;
  std::size_t count_ = 0;
};

}  // namespace Orvane
