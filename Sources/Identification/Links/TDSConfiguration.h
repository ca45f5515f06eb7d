// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <utility>

#include <Varnel/Platform/Api.h>

namespace Varnel {

/// Where the redirect service is reached, and which product asks. Plain texts that may be changed
/// at any time. Not safe to share between threads without a lock.
class VARNEL_API TDSConfiguration final {
 public:
  TDSConfiguration(std::string scheme, std::string host, std::string path, std::string productName,
                   std::string productScheme);

  /// The vendor's service: "http", the host that the product declares, "/index.php".
  TDSConfiguration(std::string productName, std::string productScheme);

  [[nodiscard]] const std::string& scheme() const { return scheme_; }
  void setScheme(std::string scheme) { scheme_ = std::move(scheme); }
  /// A plain host name.
  [[nodiscard]] const std::string& host() const { return host_; }
  void setHost(std::string host) { host_ = std::move(host); }
  /// Not percent-encoded.
  [[nodiscard]] const std::string& path() const { return path_; }
  void setPath(std::string path) { path_ = std::move(path); }
  /// The product's name as the service knows it.
  [[nodiscard]] const std::string& productName() const { return productName_; }
  void setProductName(std::string productName) { productName_ = std::move(productName); }
  /// The name of a parameter of the product's own, a flag.
  [[nodiscard]] const std::string& productScheme() const { return productScheme_; }
  void setProductScheme(std::string productScheme) { productScheme_ = std::move(productScheme); }

 private:
  std::string scheme_;
  std::string host_;
  std::string path_;
  std::string productName_;
  std::string productScheme_;
};

}  // namespace Varnel
