// SPDX-License-Identifier: MIT
#include <Tests/Contract/POSIX/UserFolders.h>
#include <Varnel/Platform/Bare/Adapters.h>

namespace Varnel::Platform::Contract {

INSTANTIATE_TEST_SUITE_P(Bare, UserDefaultsContract,
                         on<UserFolders<Bare::makeApplicationStorage>>());

}  // namespace Varnel::Platform::Contract
