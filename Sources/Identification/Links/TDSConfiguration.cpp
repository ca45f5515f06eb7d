// SPDX-License-Identifier: MIT
#include <Varnel/Identification/Links/TDSConfiguration.h>

#include <Varnel/Context/BuildSwitches.h>

namespace Varnel {

TDSConfiguration::TDSConfiguration(std::string scheme, std::string host, std::string path,
                                   std::string productName, std::string productScheme)
    : scheme_(std::move(scheme)),
      host_(std::move(host)),
      path_(std::move(path)),
      productName_(std::move(productName)),
      productScheme_(std::move(productScheme)) {}

TDSConfiguration::TDSConfiguration(std::string productName, std::string productScheme)
    : TDSConfiguration("http", BuildSwitches::ofThisProduct().redirectHost, "/index.php",
                       std::move(productName), std::move(productScheme)) {}

}  // namespace Varnel
