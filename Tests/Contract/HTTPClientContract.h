// SPDX-License-Identifier: MIT
#pragma once

#include <Tests/Contract/Contract.h>
#include <Varnel/Platform/Ports/HTTPClient.h>

namespace Varnel::Platform::Contract {

/// A web server on this machine.
class HTTPClientWorld : public WorldOf<HTTPClient> {
 public:
  /// Where the server listens, with plain http. It answers each request with the next of these: a
  /// status, "503/SECONDS" to ask for a pause, "302>PLACE", "cut" to give no answer, or "hang".
  virtual std::string serve(const std::vector<std::string>& answers) = 0;
  /// The content of the next request that was answered, waited for.
  virtual std::string nextBody() = 0;
  /// Returns when a request hangs.
  virtual void waitForHanging() = 0;
};
using HTTPClientContract = Suite<HTTPClientWorld>;

}  // namespace Varnel::Platform::Contract
