// SPDX-License-Identifier: MIT
#include <Varnel/Basalt/SecurityScopeBookkeeping.h>

#include <Varnel/Platform/Ports/SecurityScope.h>

namespace Basalt {

SecurityScopeBookkeeping::SecurityScopeBookkeeping(Varnel::Platform::SecurityScope& scope)
    : scope_(scope) {}

bool SecurityScopeBookkeeping::beginAccessingSecurityScopedResource(const URL& url,
                                                                    std::string_view propose) {
  if (!scope_.startAccessing(url)) return false;
  const std::lock_guard lock(mutex_);
  ++open_[{url, std::string(propose)}];
  return true;
}

void SecurityScopeBookkeeping::endAccessingSecurityScopedResource(const URL& url,
                                                                  std::string_view propose) {
  {
    const std::lock_guard lock(mutex_);
    const auto found = open_.find({url, std::string(propose)});
    if (found == open_.end()) return;
    if (--found->second == 0) open_.erase(found);
  }
  scope_.stopAccessing(url);
}

std::size_t SecurityScopeBookkeeping::openAccesses(const URL& url, std::string_view propose) const {
  const std::lock_guard lock(mutex_);
  const auto found = open_.find({url, std::string(propose)});
  return found == open_.end() ? 0 : found->second;
}

}  // namespace Basalt
