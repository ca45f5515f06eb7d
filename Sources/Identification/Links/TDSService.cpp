// SPDX-License-Identifier: MIT
#include <Varnel/Identification/Links/TDSService.h>

#include <iterator>
#include <utility>

#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/ProcessInfo.h>
#include <Varnel/Platform/Ports/UserLocale.h>
#include <fmt/format.h>
#include <fmt/ranges.h>

#include <Varnel/Identification/Links/TDSServiceValidator.h>
#include <Varnel/Identification/User/Identificator.h>

namespace Varnel {

using Platform::URL;

namespace {

std::string text(const Platform::OperatingSystemVersion& version) {
  return fmt::format("{}.{}.{}", version.major, version.minor, version.patch);
}

}  // namespace

TDSService::TDSService(Ports ports, std::shared_ptr<TDSConfiguration> configuration,
                       std::shared_ptr<Identificator> identificator)
    : ports_(ports),
      configuration_(std::move(configuration)),
      identificator_(std::move(identificator)),
      mainBundle_(ports.processInfo.mainBundleFolder(), {}) {}

TDSService::TDSService(std::shared_ptr<TDSConfiguration> configuration,
                       std::shared_ptr<Identificator> identificator)
    : TDSService(Platform::processPorts(), std::move(configuration), std::move(identificator)) {}

TDSService::TDSService(const Platform::Ports& ports,
                       std::shared_ptr<TDSConfiguration> configuration,
                       std::shared_ptr<Identificator> identificator)
    : TDSService({.processInfo = ports.processInfo, .userLocale = ports.userLocale},
                 std::move(configuration), std::move(identificator)) {}

bool TDSService::accepts(const TDSQueryItem& item) const {
  const auto asked = validator();
  return !asked || asked->validateQueryItem(item);
}

std::vector<TDSQueryItem> TDSService::accepted(std::vector<TDSQueryItem> items) const {
  std::erase_if(items, [this](const TDSQueryItem& item) { return !accepts(item); });
  return items;
}

std::vector<TDSQueryItem> TDSService::schemeParams() const {
  return accepted({
      {configuration_->productScheme(), std::nullopt},
      {"product", configuration_->productName()},
  });
}

std::vector<TDSQueryItem> TDSService::standartParams() const {
  return accepted({
      {"version", mainBundle_.infoText("CFBundleVersion").value_or("")},
      {"os", text(ports_.processInfo.operatingSystemVersion())},
      {"lang", fmt::format("{}", fmt::join(ports_.userLocale.languages(), ","))},
      {"qnc", ""},
      {"appType", ""},
      {"source", ""},
      {"cid", identificator_->uniqueClientIdentifier()},
  });
}

TDSService::QueryItems TDSService::defaultParams() const {
  QueryItems items;
  for (const auto& params : {schemeParams(), standartParams()})
    for (const TDSQueryItem& item : params) items.push_back(item.urlQuery());
  return items;
}

std::optional<URL> TDSService::prepareUrl(const URL& url) const {
  const QueryItems items = defaultParams();
  if (items.empty()) return url;
  // The URL's own items are not decoded and encoded again, because only the page knows their form.
  std::string query(url.components().query.value_or(""));
  if (!query.empty()) query += '&';
  return url.withQuery(query += Platform::encodedURLQuery(items));
}

std::optional<URL> TDSService::buildURL(std::optional<std::string_view> action,
                                        const std::map<std::string, std::string>& params) const {
  QueryItems items = defaultParams();
  for (const auto& [name, value] : params)
    if (accepts(TDSQueryItem(name, value))) items.push_back({name, value});
  if (action) items.push_back({"action", std::string(*action)});
  return URL::withParts(configuration_->scheme(), configuration_->host(), configuration_->path(),
                        Platform::encodedURLQuery(items));
}

}  // namespace Varnel
