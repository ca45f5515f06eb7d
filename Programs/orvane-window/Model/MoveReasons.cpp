// SPDX-License-Identifier: MIT
#include <orvane-window/Model/MoveReasons.h>

#include <orvane-window/Model/Texts.h>

namespace Orvane {
namespace {

std::string systemsReason(std::error_code code) {
  return localized("Reason_Failed", {code ? code.message() : "?"});
}

}  // namespace

std::string textOf(RemovalStep::Outcome outcome, std::error_code code) {
  using Outcome = RemovalStep::Outcome;
  switch (outcome) {
    case Outcome::planned:
    case Outcome::moved:
      break;
    case Outcome::inHiddenFolder:
      return localized("Reason_HiddenFolder");
    case Outcome::onOtherFileSystem:
      return localized("Reason_OtherFileSystem");
    case Outcome::packaged:
      return localized("Reason_Packaged");
    case Outcome::hardLinked:
      return localized("Reason_HardLinked");
    case Outcome::inTrash:
      return localized("Reason_InTrash");
    case Outcome::changed:
      return localized("Reason_Changed");
    case Outcome::different:
      return localized("Reason_Different");
    case Outcome::unreadable:
    case Outcome::noAccess:
      return localized("Reason_Unreadable");
    case Outcome::noTrash:
      return localized("Reason_NoTrash");
    case Outcome::notJournalled:
      return localized("Reason_Journal");
    case Outcome::failed:
      return systemsReason(code);
    case Outcome::misplaced:
      return localized("Reason_Misplaced");
    case Outcome::stopped:
      return localized("Reason_Stopped");
  }
  return {};
}

std::string textOf(RestorationStep::Outcome outcome, std::error_code code) {
  using Outcome = RestorationStep::Outcome;
  switch (outcome) {
    case Outcome::planned:
    case Outcome::restored:
    case Outcome::inPlace:
      break;
    case Outcome::emptied:
      return localized("Reason_Emptied");
    case Outcome::occupied:
      return localized("Reason_Occupied");
    case Outcome::noTrash:
      return localized("Reason_NoTrash");
    case Outcome::noAccess:
      return localized("Reason_Unreadable");
    case Outcome::failed:
      return systemsReason(code);
  }
  return {};
}

std::string textOf(const Removal::Problem& problem) {
  using Reason = Removal::Problem::Reason;
  switch (problem.reason) {
    case Reason::busy:
      return localized("Problem_Busy");
    case Reason::noTrash:
      return pathText(problem.path) + ": " + localized("Reason_NoTrash");
    case Reason::journal:
      return localized("Reason_Journal") + ": " + problem.description;
    case Reason::selection:
    case Reason::packages:
      break;
  }
  return problem.description;
}

std::string textOf(const Restoration::Problem& problem) {
  using Reason = Restoration::Problem::Reason;
  switch (problem.reason) {
    case Reason::unknown:
      return localized("NothingToRestore");
    case Reason::busy:
      return localized("Problem_Busy");
    case Reason::journal:
      break;
  }
  return problem.description;
}

}  // namespace Orvane
