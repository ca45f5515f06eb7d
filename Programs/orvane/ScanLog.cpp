// SPDX-License-Identifier: MIT
#include <orvane/ScanLog.h>

#include <Varnel/Logging/Logger.h>
#include <Varnel/Platform/Values/URL.h>
#include <orvane/Console.h>
#include <orvane/ShownText.h>

namespace Orvane {

std::string reasonOf(const Loss& loss) {
  switch (loss.kind) {
    case Loss::Kind::vanished:
      return "it vanished";
    case Loss::Kind::changed:
      return "it changed meanwhile";
    case Loss::Kind::incomplete:
      return "the rest of it cannot be read: " + loss.error.message();
    case Loss::Kind::unreadable:
      break;
  }
  return "it cannot be read: " + loss.error.message();
}

void ScanLog::leaveOut(const std::string& path, const Loss& loss) {
  log("Left out: " + reasonOf(loss), Varnel::Platform::URL::fileURLWithPath(path));
  if (++count_ <= maxNamed) first_.push_back({path, loss});
}

void ScanLog::networkEntered(const std::string& folder) {
  log("Will scan a network file system", Varnel::Platform::URL::fileURLWithPath(folder + "/"));
  console_.complain("\"" + folder + "\" is a network file system");
}

void ScanLog::complain() const {
  for (const LostPath& lost : first_)
    console_.complain("left out \"" + lost.path + "\": " + reasonOf(lost.loss));
  if (count_ > maxNamed)
    console_.complain(counted(count_ - maxNamed, "more was", "more were") +
                      " left out; the log names them all");
}

}  // namespace Orvane
