// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/SecurityScope.h>

#include <unistd.h>

#include <string>

#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/Values/SystemText.h>

namespace Varnel::Platform::POSIX {
namespace {

// Without a sandbox there is no gate to open: a file is readable or it is not.
class FileRights final : public SecurityScope {
 public:
  bool startAccessing(const URL& url) override {
    const std::string path = url.path();
    return url.hasScheme("file") && !isCutShort(path) && ::access(path.c_str(), R_OK) == 0;
  }
  void stopAccessing(const URL&) override {}
};

}  // namespace

std::unique_ptr<SecurityScope> makeSecurityScope() {
  return std::make_unique<FileRights>();
}

}  // namespace Varnel::Platform::POSIX
