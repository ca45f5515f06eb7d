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

/// Names in the log all that a scan leaves out, and keeps a few for the user.
class ScanLog final : public ScanObserver, public Varnel::LoggingObject {
 public:
  [[nodiscard]] std::string_view logAuthor() const override { return "ScanCommand"; }

  void fileLeftOut(const std::string& path, const Loss& loss) override { leaveOut(path, loss); }
  void folderLeftOut(const std::string& path, const Loss& loss) override {
    leaveOut(path + "/", loss);
  }

  /// Complains of the first ones, and of the others in one line.
  void complain(Console& console) const;

 private:
  static constexpr std::size_t maxNamed = 3;

  void leaveOut(const std::string& path, const Loss& loss);

  std::vector<LostPath> first_;
  std::size_t count_ = 0;
};

}  // namespace Orvane
