// SPDX-License-Identifier: MIT
#pragma once

#include <map>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include <Varnel/Context/Bundle.h>
#include <Varnel/Identification/Links/TDSConfiguration.h>
#include <Varnel/Identification/Links/TDSQueryItem.h>
#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/URL.h>
#include <Varnel/Platform/Values/URLQuery.h>

namespace Varnel::Platform {
class ProcessInfo;
class UserLocale;
struct Ports;
}  // namespace Varnel::Platform

namespace Varnel {

class Identificator;
class TDSServiceValidator;

/// Builds links to the vendor's redirect service. Nine parameters tell it which product, version,
/// system, language and client a click came from.
///
///     TDSService links(std::make_shared<TDSConfiguration>("Orvane", "ov2"), identificator);
///     links.buildURL("buy", {{"coupon", "spring"}});
///     // http://links.quennel.example/index.php?ov2&product=Orvane&…&coupon=spring&action=buy
///
/// One thread at a time. Each call reads the system's facts anew and asks the identificator, which
/// may wait: keep it off the main thread where that matters. Parts that make no URL give an absent
/// one.
class VARNEL_API TDSService final {
 public:
  struct Ports {
    Platform::ProcessInfo& processInfo;
    Platform::UserLocale& userLocale;
  };
  using QueryItems = std::vector<Platform::URLQueryItem>;

  TDSService(Ports ports, std::shared_ptr<TDSConfiguration> configuration,
             std::shared_ptr<Identificator> identificator);
  TDSService(const Platform::Ports& ports, std::shared_ptr<TDSConfiguration> configuration,
             std::shared_ptr<Identificator> identificator);
  TDSService(std::shared_ptr<TDSConfiguration> configuration,
             std::shared_ptr<Identificator> identificator);

  [[nodiscard]] const std::shared_ptr<TDSConfiguration>& configuration() const {
    return configuration_;
  }

  /// Held weakly; without one, or once it is gone, every parameter is kept.
  [[nodiscard]] std::shared_ptr<TDSServiceValidator> validator() const { return validator_.lock(); }
  void setValidator(const std::shared_ptr<TDSServiceValidator>& validator) {
    validator_ = validator;
  }

  /// The product's flag and name, less what the validator refuses.
  [[nodiscard]] std::vector<TDSQueryItem> schemeParams() const;

  /// "version", "os", "lang", "qnc", "appType", "source" and "cid", less what the validator
  /// refuses. (The spelling is part of the interface.)
  [[nodiscard]] std::vector<TDSQueryItem> standartParams() const;

  /// Both of them, in this order.
  [[nodiscard]] QueryItems defaultParams() const;

  /// The URL with the default parameters after its own, which stay byte for byte.
  [[nodiscard]] std::optional<Platform::URL> prepareUrl(const Platform::URL& url) const;

  /// A URL of the service: the default parameters, then the caller's, then the action. The
  /// validator is asked for all of them but the action.
  [[nodiscard]] std::optional<Platform::URL> buildURL(
      std::optional<std::string_view> action,
      const std::map<std::string, std::string>& params) const;

 private:
  [[nodiscard]] bool accepts(const TDSQueryItem& item) const;
  [[nodiscard]] std::vector<TDSQueryItem> accepted(std::vector<TDSQueryItem> items) const;

  Ports ports_;
  std::shared_ptr<TDSConfiguration> configuration_;
  std::shared_ptr<Identificator> identificator_;
  std::weak_ptr<TDSServiceValidator> validator_;
  Bundle mainBundle_;
};

}  // namespace Varnel
