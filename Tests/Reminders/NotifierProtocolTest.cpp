// SPDX-License-Identifier: MIT
#include <gio/gio.h>
#include <gtest/gtest.h>

#include <set>
#include <string>

#include <Varnel/Platform/Linux/Notifications/HostName.h>
#include <Varnel/Platform/Linux/Notifications/NotifierProtocol.h>

namespace Varnel::Platform::Linux {
namespace {

using Variant = UniqueHandle<GVariant*, g_variant_unref>;

TEST(NotifierProtocol, EveryBaseIdentifierHasAHostNameOfItsOwn) {
  const std::string start = "com.quennel.Varnel.Host.", end = ".Client";
  const std::pair<std::string, std::string> cases[] = {
      {"com.quennel.Orvane2", "com.quennel.Orvane2"},
      {"com.quennel.Orvane-marketta", "com.quennel.Orvane_2dmarketta"},
      {"orvane", "orvane"},
      {"2fast.4you", "_32fast._34you"},
      {"a_2db", "a_5f2db"},
      {"a..b.", "a._2eb_2e"},
      {"../ü", "_2e._2f_c3_bc"},
      {"", "_"},
  };
  for (const auto& [identifier, middle] : cases)
    EXPECT_EQ(hostName(identifier), start + middle + end) << identifier;

  const std::string pieces[] = {"a",
                                "2",
                                ".",
                                "_",
                                "-",
                                "\xff",
                                std::string(1, '\0'),
                                std::string(224, 'x'),
                                std::string(75, '/')};
  std::set<std::string> names;
  std::size_t count = 0;
  for (const auto& first : pieces)
    for (const auto& second : pieces)
      for (const auto& third : pieces) {
        const std::string name = hostName(first + second + third);
        EXPECT_TRUE(g_dbus_is_name(name.c_str()) && !g_dbus_is_unique_name(name.c_str())) << name;
        names.insert(name);
        names.insert(frontName(first + second + third));
        count += 2;
      }
  EXPECT_EQ(names.size(), count);
}

TEST(NotifierProtocol, ANotificationArrivesAsItWasSent) {
  const UserNotification cases[] = {
      {},
      {.identifier = "", .title = std::string("\0\xff", 2)},
      {.identifier = "a",
       .title = "b",
       .informativeText = "c",
       .actionButtonTitle = "d",
       .otherButtonTitle = "e",
       .deliveryDate = Date::min(),
       .deliveryRepeatInterval = DateComponents{1, 2, 3, 4, 5, 6},
       .actualDeliveryDate = Date::max(),
       .activationToken = "f"},
  };
  for (const auto& sent : cases) {
    const Variant dictionary(g_variant_ref_sink(variantOf(sent)));
    EXPECT_EQ(notificationIn(dictionary.get()), sent);
  }
}

TEST(NotifierProtocol, WhatIsNoNotificationIsLeftOut) {
  const Variant forged(
      g_variant_ref_sink(g_variant_new_parsed("{'title': <'text'>, 'date': <b'bytes'>, 'days': "
                                              "<uint64 7>, 'other': <b'Later'>, '': <1>}")));
  // The last byte of GVariant's own byte strings is their end.
  EXPECT_EQ(notificationIn(forged.get()),
            UserNotification{.otherButtonTitle = std::string("Later\0", 6)});
}

}  // namespace
}  // namespace Varnel::Platform::Linux
