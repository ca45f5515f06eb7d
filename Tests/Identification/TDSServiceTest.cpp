// SPDX-License-Identifier: MIT
#include <Varnel/Identification/Links/TDSService.h>

#include <functional>

#include <Varnel/Identification/Links/TDSServiceValidator.h>
#include <Varnel/Identification/User/Identificator.h>
#include <Varnel/Platform/Testing/FakeProcessInfo.h>
#include <Varnel/Platform/Testing/FakeUser.h>
#include <gtest/gtest.h>

#include <Tests/Context/PropertyLists.h>
#include <Tests/Support/TemporaryFolder.h>

namespace Varnel {
namespace {

using Platform::URL;

class FixedIdentificator final : public Identificator {
 public:
  std::string uniqueClientIdentifier() const override { return "12.34"; }
};

class RuleValidator final : public TDSServiceValidator {
 public:
  explicit RuleValidator(std::function<bool(const TDSQueryItem&)> rule) : rule_(std::move(rule)) {}
  bool validateQueryItem(const TDSQueryItem& item) override { return rule_(item); }

 private:
  std::function<bool(const TDSQueryItem&)> rule_;
};

class TDSServiceTest : public testing::Test {
 protected:
  TDSServiceTest() {
    bundle_.write("Info.plist", Tests::propertyList({{"CFBundleVersion", "2.1 (7)"}}));
    process_.mainBundle = bundle_.path().string();
    process_.systemVersion = {10, 12, 6};
    locale_.languageTags = {"en-US", "de"};
  }

  TDSService service() {
    return TDSService({.processInfo = process_, .userLocale = locale_}, configuration_,
                      std::make_shared<FixedIdentificator>());
  }

  std::string prepared(std::string_view text) {
    return service().prepareUrl(*URL::parse(text))->absoluteString();
  }

  static constexpr std::string_view nine =
      "ov2&product=Orvane%202&version=2.1%20(7)&os=10.12.6&lang=en-US,de&qnc=&appType=&source="
      "&cid=12.34";

  Tests::TemporaryFolder bundle_;
  Platform::Testing::FakeProcessInfo process_;
  Platform::Testing::FakeUserLocale locale_;
  std::shared_ptr<TDSConfiguration> configuration_ =
      std::make_shared<TDSConfiguration>("http", "r.example", "/index.php", "Orvane 2", "ov2");
};

TEST_F(TDSServiceTest, GivenLinksKeepTheirBytesAndGainTheNineItems) {
  const std::pair<std::string_view, std::string> cases[] = {
      {"https://h.example/a", "https://h.example/a?"},
      {"https://h.example/a?", "https://h.example/a?"},
      {"https://h.example/?lang=fr&lang=%66r", "https://h.example/?lang=fr&lang=%66r&"},
      {"http://h/?a;b=c=d+e", "http://h/?a;b=c=d+e&"},
      {"http://[::1]:8080/a b?\xC3\xBC", "http://[::1]:8080/a%20b?%C3%BC&"},
      {"mailto:a@b.example", "mailto:a@b.example?"},
  };
  for (const auto& [text, begin] : cases) {
    EXPECT_EQ(prepared(text), begin + std::string(nine));
    EXPECT_EQ(prepared(std::string(text) + "#top"), begin + std::string(nine) + "#top");
  }
  const URL base = *URL::parse("https://h.example/shop/index");
  EXPECT_EQ(service().prepareUrl(*URL::parse("buy?x#y", base))->absoluteString(),
            "https://h.example/shop/buy?x&" + std::string(nine) + "#y");
}

TEST_F(TDSServiceTest, AValidatorThatRefusesEverythingLeavesLinksUntouched) {
  const auto refuse = std::make_shared<RuleValidator>([](const TDSQueryItem&) { return false; });
  TDSService strict = service();
  strict.setValidator(refuse);
  for (const char* text : {"http://h/a", "http://h/a?#", "http://h/?%41=&&;+&x#y", "a/b?c"})
    EXPECT_EQ(strict.prepareUrl(*URL::parse(text))->absoluteString(), text);
  // The action is not the validator's to refuse.
  EXPECT_EQ(strict.buildURL("buy", {{"a", "b"}})->absoluteString(),
            "http://r.example/index.php?action=buy");
}

TEST_F(TDSServiceTest, AValidatorSeesItemsInOrderAndIsHeldWeakly) {
  std::string seen;
  auto nosy = std::make_shared<RuleValidator>([&](const TDSQueryItem& item) {
    seen += item.name() + (item.value() ? "=" + *item.value() : "") + " ";
    return item.name() != "product" && item.name() != "b";
  });
  TDSService links = service();
  links.setValidator(nosy);
  const auto url = links.buildURL("go", {{"b", "2"}, {"a", "1"}, {"c", ""}});
  EXPECT_EQ(seen,
            "ov2 product=Orvane 2 version=2.1 (7) os=10.12.6 lang=en-US,de qnc= appType= "
            "source= cid=12.34 a=1 b=2 c= ");
  EXPECT_EQ(
      url->absoluteString(),
      "http://r.example/index.php?ov2&version=2.1%20(7)&os=10.12.6&lang=en-US,de&qnc=&appType="
      "&source=&cid=12.34&a=1&c=&action=go");
  nosy.reset();
  EXPECT_EQ(links.defaultParams().size(), 9u);
}

TEST_F(TDSServiceTest, BuildsLinksFromItsConfigurationAsItStands) {
  process_.mainBundle.reset();
  const TDSService links = service();
  const std::string all =
      "ov2&product=Orvane%202&version=&os=10.12.6&lang=en-US,de&qnc=&appType="
      "&source=&cid=12.34";
  EXPECT_EQ(links.buildURL(std::nullopt, {})->absoluteString(),
            "http://r.example/index.php?" + all);
  EXPECT_EQ(links.buildURL("a&b", {})->absoluteString(),
            "http://r.example/index.php?" + all + "&action=a%26b");
  configuration_->setScheme("https");
  configuration_->setPath("/go here");
  EXPECT_TRUE(links.buildURL("", {})->absoluteString().starts_with("https://r.example/go%20here?"));
  configuration_->setHost("not a host");
  EXPECT_FALSE(links.buildURL("a", {}));
}

}  // namespace
}  // namespace Varnel
