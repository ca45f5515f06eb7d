// SPDX-License-Identifier: MIT
// What the disk-image tool prints. A path found is that of an image in the list.
#include <Fuzz/Fuzz.h>
#include <Varnel/Platform/Testing/FakeProcessLauncher.h>
#include <Varnel/Provenance/DiskImages.h>

using namespace Varnel;

static void fuzz(std::string_view input) {
  Platform::Testing::FakeProcessLauncher launcher;
  launcher.script.output = std::string(input);
  const auto volumes = mountedDrivesInfo(launcher, "/usr/bin/hdiutil", std::nullopt);
  if (!volumes) return;
  if (const auto path = findImagePath("/Volumes/Orvane", *volumes))
    require(path->empty() || input.find(path->front()) != input.npos ||
            input.starts_with("bplist"));
}
