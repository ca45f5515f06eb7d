// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/ExtendedAttributes.h>

#include <sys/xattr.h>

#include <cerrno>

#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Values/SystemText.h>

namespace Varnel::Platform::Linux {
namespace {

// Applications may only write below this prefix; other systems have none.
constexpr const char* userNamespace = "user.";

std::optional<std::string> absentOr(std::error_code& error) {
  const int code = errno;
  if (code != ENODATA) error = {code, std::generic_category()};
  return std::nullopt;
}

std::optional<std::string> read(const std::string& path, const std::string& name,
                                std::error_code& error) {
  while (true) {
    const ssize_t size = ::getxattr(path.c_str(), name.c_str(), nullptr, 0);
    if (size < 0) return absentOr(error);
    if (size == 0) return std::string();
    std::string bytes(static_cast<std::size_t>(size), '\0');
    const ssize_t length = ::getxattr(path.c_str(), name.c_str(), bytes.data(), bytes.size());
    // The attribute has grown since it was measured.
    if (length < 0 && errno == ERANGE) continue;
    if (length < 0) return absentOr(error);
    bytes.resize(static_cast<std::size_t>(length));
    return bytes;
  }
}

class UserAttributes final : public ExtendedAttributes {
 public:
  Result<std::optional<std::string>, std::error_code> value(const std::string& path,
                                                            const std::string& name) override {
    if (name.empty() || isCutShort(name) || isCutShort(path))
      return std::make_error_code(std::errc::invalid_argument);
    std::error_code error;
    auto bytes = read(path, userNamespace + name, error);
    if (error) return error;
    return bytes;
  }
};

}  // namespace

std::unique_ptr<ExtendedAttributes> makeExtendedAttributes() {
  return std::make_unique<UserAttributes>();
}

}  // namespace Varnel::Platform::Linux
