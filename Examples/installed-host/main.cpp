// SPDX-License-Identifier: MIT
// Says who it is and which version of the framework it runs on.
#include <iostream>

#include <Varnel/Context/Globals.h>
#include <Varnel/Context/VarnelModule.h>

int main() {
  const auto framework = Varnel::VarnelModule::instance();
  std::cout << Varnel::Globals::applicationName() << ' '
            << Varnel::Globals::applicationVersionString() << " on version " << framework->version()
            << " of the framework\n";
}
