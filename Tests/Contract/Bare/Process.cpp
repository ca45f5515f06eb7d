// SPDX-License-Identifier: MIT
#include <Tests/Contract/POSIX/ProcessColumns.h>
#include <Varnel/Platform/Bare/Adapters.h>

namespace Varnel::Platform::Contract {

INSTANTIATE_TEST_SUITE_P(Bare, ProcessInfoContract, on<OwnProcess<Bare::makeProcessInfo>>());
INSTANTIATE_TEST_SUITE_P(Bare, StandardOutputContract, on<Output<Bare::makeStandardOutput>>());
INSTANTIATE_TEST_SUITE_P(BareErrors, StandardOutputContract, on<Output<makeStandardErrorOutput>>());

}  // namespace Varnel::Platform::Contract
