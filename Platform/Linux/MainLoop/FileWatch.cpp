// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Linux/MainLoop/FileWatch.h>

#include <sys/inotify.h>

#include <unistd.h>

#include <array>
#include <cstddef>
#include <cstdint>
#include <set>
#include <utility>

namespace Varnel::Platform::Linux {
namespace {

namespace fs = std::filesystem;

// A database is written through a file that stays open, so its closing cannot be waited for.
constexpr std::uint32_t changes =
    IN_MODIFY | IN_CREATE | IN_DELETE | IN_MOVED_TO | IN_MOVED_FROM | IN_ATTRIB;

POSIX::FileDescriptor watchOf(const fs::path& folder, std::uint32_t events) {
  POSIX::FileDescriptor descriptor(::inotify_init1(IN_NONBLOCK | IN_CLOEXEC));
  if (descriptor) ::inotify_add_watch(descriptor.get(), folder.c_str(), events);
  return descriptor;
}

}  // namespace

FileWatch::FileWatch(const fs::path& folder, std::string name, std::function<void()> changed)
    : name_(std::move(name)),
      changed_([changed = std::move(changed)](const auto&) { changed(); }),
      descriptor_(watchOf(folder, changes)),
      source_(descriptor_.get(), [this] { readEvents(); }) {}

FileWatch::FileWatch(const fs::path& folder, std::function<void(const std::string& name)> come)
    : changed_(std::move(come)),
      descriptor_(watchOf(folder, IN_CREATE | IN_MOVED_TO)),
      source_(descriptor_.get(), [this] { readEvents(); }) {}

void FileWatch::readEvents() {
  alignas(inotify_event) std::array<char, 4096> buffer{};
  std::set<std::string> concerned;
  while (true) {
    const ssize_t size = ::read(descriptor_.get(), buffer.data(), buffer.size());
    if (size <= 0) break;
    for (ssize_t offset = 0; offset < size;) {
      const auto* event = reinterpret_cast<const inotify_event*>(buffer.data() + offset);
      offset += static_cast<ssize_t>(sizeof(inotify_event) + event->len);
      // After an overflow, anything may have changed.
      if ((event->mask & IN_Q_OVERFLOW) != 0)
        concerned.insert(name_);
      else if (event->len > 0 && (name_.empty() || name_ == event->name))
        concerned.insert(event->name);
    }
  }
  for (const std::string& name : concerned) changed_(name);
}

}  // namespace Varnel::Platform::Linux
