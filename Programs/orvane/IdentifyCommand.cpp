// SPDX-License-Identifier: MIT
#include <orvane/IdentifyCommand.h>

#include <memory>

#include <Varnel/Identification/User/KeptDownloadSource.h>
#include <Varnel/Identification/User/UserIdentificationInfo.h>
#include <Varnel/Identification/User/UserIdentificator.h>
#include <orvane/Console.h>
#include <orvane/FactList.h>

namespace Orvane {

int IdentifyCommand::run(Console& console) const {
  const auto user =
      std::make_shared<Varnel::KeptDownloadSource>(std::make_shared<Varnel::UserIdentificator>());
  FactList facts;
  facts.add("machineUUID", "machine UUID", user->machineUUID());
  facts.add("serialNumber", "serial number", user->serialNumber());
  facts.add("userIdentifier", "user identifier", user->userIdentifier());
  facts.add("primaryMacAddress", "primary MAC address", user->primaryMacAddress());
  facts.add("downloadSourceURL", "download source", user->downloadSourceURLString());
  facts.add("downloadSourceURLCid", "download campaign", user->downloadSourceURLCid());
  facts.add("GACookieValue", "web analytics client", user->GACookieValue());
  facts.add("uniqueClientIdentifier", "unique client identifier",
            Varnel::UserIdentificationInfo(user).uniqueClientIdentifier());
  const auto form = isJSON ? FactList::Form::json : FactList::Form::lines;
  return console.writeResult(facts.text(form)) ? 0 : 1;
}

}  // namespace Orvane
