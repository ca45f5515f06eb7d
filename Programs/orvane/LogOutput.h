// SPDX-License-Identifier: MIT
#pragma once

namespace Orvane {

class Console;

/// Sends what the framework's logger prints to the console's standard error, so that standard
/// output holds the result alone. To be called before anything of the framework is used; the
/// console lives as long as the process.
void sendLogTo(Console& console);

}  // namespace Orvane
