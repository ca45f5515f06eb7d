// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include <memory>
#include <random>
#include <set>
#include <vector>

#include <Varnel/Basalt/Bag.h>
#include <Varnel/Basalt/Block.h>
#include <Varnel/Basalt/SecurityScopeBookkeeping.h>
#include <Varnel/Platform/Testing/FakeSecurityScope.h>

namespace Basalt {
namespace {

using Varnel::Platform::URL;
using Varnel::Platform::Testing::FakeSecurityScope;

TEST(Bag, HoldsAValueAsOftenAsItWasInserted) {
  // Sizes around the capacity that costs no allocation, against a sorted list.
  std::minstd_rand random(7);
  Bag<unsigned> bag;
  std::multiset<unsigned> model;
  for (int step = 0; step < 5000; ++step) {
    const unsigned value = static_cast<unsigned>(random()) % 5;
    const bool inserts = static_cast<unsigned>(random()) % 16 < (model.size() < 9 ? 10 : 6);
    if (inserts) {
      bag.insert(value);
      model.insert(value);
    } else {
      const auto found = model.find(value);
      ASSERT_EQ(bag.remove(value), found != model.end());
      if (found != model.end()) model.erase(found);
    }
    ASSERT_EQ(bag.count(), model.size());
    ASSERT_EQ(bag.count(value), model.count(value));
    ASSERT_EQ(bag.contains(value), model.contains(value));
  }
}

TEST(Block, OwnsItsCaptureOnceWhereverItMoves) {
  const auto token = std::make_shared<int>(0);
  struct Large {
    std::shared_ptr<int> token;
    char more[100] = {};
  };
  std::vector<Block> blocks;
  for (int i = 0; i < 10; ++i) {
    blocks.emplace_back([token] { ++*token; });
    blocks.emplace_back([large = Large{token}] { ++*large.token; });
  }
  EXPECT_EQ(token.use_count(), 21);
  for (Block& block : blocks) block();
  EXPECT_EQ(*token, 20);
  blocks[1] = std::move(blocks[0]);
  EXPECT_FALSE(blocks[0]);
  blocks.clear();
  EXPECT_EQ(token.use_count(), 1);
}

TEST(SecurityScopeBookkeeping, ClosesExactlyWhatItOpened) {
  FakeSecurityScope scope;
  SecurityScopeBookkeeping scopes(scope);
  const URL file = URL::fileURLWithPath("/file");
  const URL secret = URL::fileURLWithPath("/secret");
  scope.forbid(secret);
  EXPECT_FALSE(scopes.beginAccessingSecurityScopedResource(secret, "scan"));
  scopes.endAccessingSecurityScopedResource(secret, "scan");
  EXPECT_EQ(scope.openAccesses(secret), 0);

  EXPECT_TRUE(scopes.beginAccessingSecurityScopedResource(file, "scan"));
  EXPECT_TRUE(scopes.beginAccessingSecurityScopedResource(file, "scan"));
  EXPECT_TRUE(scopes.beginAccessingSecurityScopedResource(file, "preview"));
  EXPECT_EQ(scopes.openAccesses(file, "scan"), 2u);
  scopes.endAccessingSecurityScopedResource(file, "other");
  scopes.endAccessingSecurityScopedResource(file, "preview");
  scopes.endAccessingSecurityScopedResource(file, "preview");
  EXPECT_EQ(scope.openAccesses(file), 2);
}

}  // namespace
}  // namespace Basalt
