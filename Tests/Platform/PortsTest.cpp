// SPDX-License-Identifier: MIT
#include <filesystem>
#include <functional>
#include <type_traits>

#include <gtest/gtest.h>

#include <Varnel/Platform/Ports/MainQueue.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Testing/FakePorts.h>

namespace Varnel::Platform::Testing {
namespace {

template <typename... Port>
constexpr bool areAssignable(const std::reference_wrapper<Port>&...) {
  return (std::is_assignable_v<Port&, const Port&> || ...);
}

// Otherwise an assignment to a member of a class's set of plain references would compile, and go
// through to the service.
TEST(Ports, CannotBeAssignedThemselves) {
  FakePorts fakes;
  const auto& [a, b, c, d, e, f, g, h, i, j, k, l, m, n, o, p, q, r, s, t, u, v, w, x, y, z, aa] =
      fakes.ports();
  EXPECT_FALSE(areAssignable(a, b, c, d, e, f, g, h, i, j, k, l, m, n, o, p, q, r, s, t, u, v, w, x,
                             y, z, aa));
}

// A program of the command line may never run it, and would be told so after a while.
TEST(Ports, PostNothingOnTheirOwn) {
  EXPECT_FALSE(systemPorts().mainQueue.get().drain());
}

TEST(FakePorts, TakeTheirFilesAwayWithThem) {
  std::string spool;
  {
    FakePorts fakes;
    spool = fakes.applicationStorage.analyticsSpoolPath("com.example.Fotovia");
    ASSERT_TRUE(fakes.privateFiles.prepare(spool));
    EXPECT_TRUE(std::filesystem::exists(spool));
  }
  EXPECT_FALSE(std::filesystem::exists(spool));
}

}  // namespace
}  // namespace Varnel::Platform::Testing
