// SPDX-License-Identifier: MIT
// Archived resolvers. What is archived again is the same resolver.
#include <Fuzz/Fuzz.h>
#include <Varnel/Paths/QNURLResolver.h>
#include <Varnel/Platform/Text/KeyedArchive.h>

using namespace Varnel;

static std::optional<QNURLResolver> decoded(std::string_view bytes) {
  const auto archive = Platform::KeyedUnarchiver::open(bytes);
  return archive ? QNURLResolver::decode(*archive) : std::nullopt;
}

static void fuzz(std::string_view input) {
  const auto resolver = decoded(input);
  if (!resolver) return;
  Platform::KeyedArchiver archiver;
  resolver->encode(archiver);
  const auto again = decoded(archiver.bytes());
  require(again && *again == *resolver && again->hash() == resolver->hash());

  for (const Platform::URL& base : {resolver->homeURL(), resolver->rootURL()}) {
    const std::string path = resolver->abbreviatedPath(base.path(), true);
    static_cast<void>(resolver->abbreviatedPathForURL(base, false));
    static_cast<void>(resolver->fileURLWithPath(path));
    const bool isWhole = resolver->expandedPathForPath(path).has_value();
    // A home without a path is the beginning of every path, and "~" stands for nothing then.
    require(isWhole == !path.empty() || resolver->homeURLPathComponents().empty());
  }
}
