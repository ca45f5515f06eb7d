// SPDX-License-Identifier: MIT
// Says who it is and which version of the framework it runs on.
#include <iostream>

#include <Varnel/Context/Globals.h>
#include <Varnel/Context/VarnelModule.h>

int main() {
  std::cout << Varnel::Globals::applicationName() << ' '
            << Varnel::Globals::applicationVersionString() << '\n'
            << "the framework's version is " << Varnel::VarnelModule::instance()->version() << '\n';
}
