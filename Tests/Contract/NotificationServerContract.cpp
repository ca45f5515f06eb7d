// SPDX-License-Identifier: MIT
#include <Tests/Contract/NotificationWorlds.h>

#include <gmock/gmock.h>

#include <map>
#include <utility>

#include <Varnel/Platform/Testing/FakeNotificationServer.h>

namespace Varnel::Platform::Contract {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;

struct Listener final : NotificationServer::Observer {
  std::vector<std::string> heard;
  std::map<std::string, std::string> references;
  std::function<void(const std::string& token)> onShown = [](const auto&) {};

  void bannerShown(const std::string& token, const std::string& reference) override {
    heard.push_back("shown " + token);
    references[token] = reference;
    onShown(token);
  }
  void bannerFailed(const std::string& token) override { heard.push_back("failed " + token); }
  void bannerActivated(const std::string& token, const BannerActivation&) override {
    heard.push_back("clicked " + token);
  }
  void bannerDismissed(const std::string& token) override { heard.push_back("dismissed " + token); }
  void bannerGone(const std::string& token) override { heard.push_back("gone " + token); }
  void serverAppeared() override { heard.emplace_back("appeared"); }
};

// What the listener has heard, so much at least, when nothing is under way any more.
std::vector<std::string> heardBy(Listener& listener, NotificationServerWorld& world,
                                 std::size_t count = 0) {
  world.workUntil([&] { return listener.heard.size() >= count && !world.port().isBusy(); });
  return std::exchange(listener.heard, {});
}

std::shared_ptr<Listener> listenTo(NotificationServer& server) {
  auto listener = std::make_shared<Listener>();
  server.setObserver(listener);
  return listener;
}

std::vector<std::string> titles(NotificationServerWorld& world) {
  std::vector<std::string> titles;
  for (const Banner& banner : world.banners()) titles.push_back(banner.title);
  return titles;
}

TEST_P(NotificationServerContract, ShowsABannerAndTellsLaterHowItEnded) {
  NotificationServer& server = world->port();
  const auto listener = listenTo(server);
  const Banner banner{.title = "A", .text = "text", .actionTitle = "Go", .dismissTitle = "Later"};
  const std::pair<void (NotificationServerWorld::*)(const std::string&), const char*> ends[] = {
      {&NotificationServerWorld::activate, "clicked 1"},
      {&NotificationServerWorld::dismiss, "dismissed 1"}};
  for (const auto& [end, name] : ends) {
    server.show("1", banner, {});
    EXPECT_TRUE(server.isBusy());
    EXPECT_THAT(listener->heard, IsEmpty()) << "never within the call";
    EXPECT_THAT(heardBy(*listener, *world), ElementsAre("shown 1"));
    EXPECT_THAT(world->banners(), ElementsAre(banner));
    (*world.*end)("A");
    EXPECT_THAT(heardBy(*listener, *world, 1), ElementsAre(name));
    EXPECT_THAT(world->banners(), IsEmpty());
    // The banner is not known any more.
    server.close("1", listener->references["1"]);
    EXPECT_THAT(listener->heard, IsEmpty()) << "never within the call";
    EXPECT_THAT(heardBy(*listener, *world), ElementsAre("gone 1"));
  }
}

TEST_P(NotificationServerContract, AnExpiredBannerIsGoneAndMayYetBeClickedOnce) {
  const auto listener = listenTo(world->port());
  world->port().show("1", {.title = "A"}, {});
  EXPECT_THAT(heardBy(*listener, *world), ElementsAre("shown 1"));
  world->expire("A");
  EXPECT_THAT(heardBy(*listener, *world, 1), ElementsAre("gone 1"));
  EXPECT_THAT(world->banners(), IsEmpty());
  for (int i = 0; i < 2; ++i) world->activate("A");
  EXPECT_THAT(heardBy(*listener, *world, 1), ElementsAre("clicked 1"));

  world->port().show("2", {.title = "B"}, {});
  EXPECT_THAT(heardBy(*listener, *world), ElementsAre("shown 2"));
  world->expire("B");
  world->workUntil([&] { return !listener->heard.empty(); });
  world->endServer();
  world->startServer();
  EXPECT_THAT(heardBy(*listener, *world, 2), ElementsAre("gone 2", "appeared"));
}

TEST_P(NotificationServerContract, ABannerThatIsClosedIsGoneOnceAndNothingElse) {
  NotificationServer& server = world->port();
  const auto listener = listenTo(server);
  server.show("1", {.title = "A"}, {});
  server.show("2", {.title = "B"}, {});
  server.close("1", {});
  EXPECT_THAT(heardBy(*listener, *world), testing::UnorderedElementsAre("gone 1", "shown 2"));
  EXPECT_THAT(titles(*world), ElementsAre("B"));
  server.close("2", {});
  EXPECT_THAT(heardBy(*listener, *world), ElementsAre("gone 2"));
  server.close("3", {});
  server.close("4", "no reference");
  EXPECT_THAT(heardBy(*listener, *world), ElementsAre("gone 3", "gone 4")) << "never shown";
  // Also from within a call.
  listener->onShown = [&](const std::string& token) { server.close(token, {}); };
  server.show("5", {.title = "C"}, {});
  EXPECT_THAT(heardBy(*listener, *world), ElementsAre("shown 5", "gone 5"));
  EXPECT_THAT(titles(*world), IsEmpty());
}

TEST_P(NotificationServerContract, ABannerTakesThePlaceOfAnother) {
  NotificationServer& server = world->port();
  const auto listener = listenTo(server);
  server.show("1", {.title = "A"}, {});
  EXPECT_THAT(heardBy(*listener, *world), ElementsAre("shown 1"));
  server.show("2", {.title = "B"}, listener->references["1"]);
  EXPECT_THAT(heardBy(*listener, *world), ElementsAre("shown 2"));
  EXPECT_THAT(titles(*world), ElementsAre("B"));
  for (const char* reference : {"no reference", ""}) {
    server.show("3", {.title = "C"}, reference);
    EXPECT_THAT(heardBy(*listener, *world), ElementsAre("shown 3"));
    EXPECT_THAT(titles(*world), testing::UnorderedElementsAre("B", "C"));
    server.close("3", {});
    EXPECT_THAT(heardBy(*listener, *world), ElementsAre("gone 3"));
  }
  world->dismiss("B");
  EXPECT_THAT(heardBy(*listener, *world, 1), ElementsAre("dismissed 2"));
}

TEST_P(NotificationServerContract, ItsEndTakesTheBannersAndFailsWhatItHasNotAnswered) {
  NotificationServer& server = world->port();
  const auto listener = listenTo(server);
  server.show("1", {.title = "A"}, {});
  EXPECT_THAT(heardBy(*listener, *world), ElementsAre("shown 1"));
  server.show("2", {.title = "B"}, {});
  world->endServer();
  EXPECT_THAT(heardBy(*listener, *world, 2), testing::UnorderedElementsAre("gone 1", "failed 2"));

  // And while there is none.
  server.show("3", {.title = "C"}, {});
  EXPECT_THAT(heardBy(*listener, *world), ElementsAre("failed 3"));
  server.close("1", listener->references["1"]);
  EXPECT_THAT(heardBy(*listener, *world), ElementsAre("gone 1"));
  world->startServer();
  EXPECT_THAT(heardBy(*listener, *world, 1), ElementsAre("appeared"));
  server.show("4", {.title = "D"}, listener->references["1"]);
  EXPECT_THAT(heardBy(*listener, *world), ElementsAre("shown 4"));
  EXPECT_THAT(titles(*world), ElementsAre("D"));
}

TEST_P(NotificationServerContract, TellsWhatStandsInTheWayAlsoWithoutAnObserver) {
  std::vector<bool> obstacles;
  const auto ask = [&] {
    const std::size_t before = obstacles.size();
    world->port().check([&](const auto& obstacle) { obstacles.push_back(obstacle.has_value()); });
    EXPECT_EQ(obstacles.size(), before) << "never within the call";
    world->workUntil([&] { return !world->port().isBusy(); });
  };
  ask();
  world->endServer();
  ask();
  world->startServer();
  ask();
  EXPECT_THAT(obstacles, ElementsAre(false, true, false));
}

class FakeNotificationServerWorld final
    : public FakeColumn<NotificationServerWorld, Testing::FakeNotificationServer> {
 public:
  std::vector<Banner> banners() override {
    std::vector<Banner> banners;
    for (const auto& [title, banner] : port_.banners()) banners.push_back(banner);
    return banners;
  }
  void activate(const std::string& title) override { port_.activate(title); }
  void dismiss(const std::string& title) override { port_.dismiss(title); }
  void expire(const std::string& title) override { port_.expire(title); }
  void endServer() override { port_.disappear(); }
  void startServer() override { port_.appear(); }
  void workUntil(const std::function<bool()>& condition) override {
    port_.report();
    EXPECT_TRUE(condition());
  }
};
INSTANTIATE_TEST_SUITE_P(Fake, NotificationServerContract, on<FakeNotificationServerWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
