// SPDX-License-Identifier: MIT
#include <Tests/Contract/CookieStorageContract.h>

#include <Varnel/Platform/Testing/FakeCookieStorage.h>

namespace Varnel::Platform::Contract {
namespace {

TEST_P(CookieStorageContract, ListsEachStoreInItsOrderAndNoNameLeadsElsewhere) {
  CookieStorage& storage = world->storage();
  EXPECT_TRUE(storage.hasGroupContainers());
  EXPECT_TRUE(storage.cookies().empty());
  EXPECT_TRUE(storage.cookiesOfGroupContainer("group").empty());

  const std::vector<Cookie> own = {{".b.example", "/", "z", "1"},
                                   {"a.example", "/path", "a", "ünïcode \n;"},
                                   {"a.example", "/", "empty", ""}};
  const std::vector<Cookie> shared = {{".b.example", "/", "z", "2"}};
  world->fillOwn(own);
  world->fillGroup("group", shared);
  EXPECT_EQ(storage.cookies(), own);
  EXPECT_EQ(storage.cookiesOfGroupContainer("group"), shared);
  for (const char* name : {"", ".", "..", "other", "/group", "../own", "x/../group"})
    EXPECT_TRUE(storage.cookiesOfGroupContainer(name).empty()) << name;
}

class FakeWorld final : public CookieStorageWorld {
 public:
  CookieStorage& storage() override { return storage_; }
  void fillOwn(const std::vector<Cookie>& cookies) override { storage_.own = cookies; }
  void fillGroup(const std::string& identifier, const std::vector<Cookie>& cookies) override {
    storage_.ofGroup[identifier] = cookies;
  }

 private:
  Testing::FakeCookieStorage storage_;
};
INSTANTIATE_TEST_SUITE_P(Fake, CookieStorageContract, CookieStorageContract::on<FakeWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
