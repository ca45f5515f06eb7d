// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <string>

#include <Varnel/Context/BuildSwitches.h>
#include <Varnel/Identification/User/Identificator.h>
#include <Varnel/Identification/User/UserIdentificationProvider.h>
#include <Varnel/Platform/Api.h>

namespace Varnel {

/// Makes one identifier of many, the one that links and analytics carry.
///
///     UserIdentificationInfo info(std::make_shared<UserIdentificator>());
///     link.add(info.uniqueClientIdentifier());
///
/// The web site's build prefers the download's campaign, then the client id of the web-analytics
/// cookie, so that a visitor of the site and a user of the application are seen as one; every other
/// build, and where there is neither, takes the user identifier. Asks the provider at each reading;
/// threads as the provider's.
class VARNEL_API UserIdentificationInfo final : public Identificator {
 public:
  /// `switches` tell the build, by default this one.
  explicit UserIdentificationInfo(std::shared_ptr<UserIdentificationProvider> identificator);
  UserIdentificationInfo(std::shared_ptr<UserIdentificationProvider> identificator,
                         const BuildSwitches& switches);

  [[nodiscard]] const std::shared_ptr<UserIdentificationProvider>& identificator() const {
    return identificator_;
  }

  [[nodiscard]] std::string uniqueClientIdentifier() const override;

 private:
  const std::shared_ptr<UserIdentificationProvider> identificator_;
  const bool isSiteVersion_;
};

}  // namespace Varnel
