// SPDX-License-Identifier: MIT
#pragma once

#include <algorithm>
#include <cstddef>
#include <iterator>
#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <set>
#include <string>
#include <utility>
#include <vector>

#include <Varnel/Platform/Ports/VolumeCatalog.h>
#include <Varnel/Platform/Testing/FaultPlan.h>

namespace Varnel::Platform::Testing {

/// A machine with the volumes that the test mounts. Any thread.
///
///     FakeVolumeCatalog catalog;
///     catalog.mount({.url = URL::fileURLWithPath("/"), .isLocal = true});
///     catalog.setLookupError(PlatformError("Test", 1));  // from now on volumeURL() fails
///
/// Handlers run on the thread that makes the change, before the call returns. A handler may ask the
/// catalogue, but must not subscribe nor end a subscription.
class FakeVolumeCatalog final : public VolumeCatalog {
 public:
  /// Questions and subscriptions. A list that goes wrong is empty.
  std::shared_ptr<FaultPlan> faults = std::make_shared<FaultPlan>();

  /// Replaces the list without telling anybody.
  void setVolumes(std::vector<MountedVolume> volumes) {
    const std::lock_guard lock(mutex_);
    volumes_ = std::move(volumes);
  }

  void mount(const MountedVolume& volume) {
    {
      const std::lock_guard lock(mutex_);
      volumes_.push_back(volume);
    }
    announce({.kind = VolumeChange::Kind::mounted, .volumeURL = volume.url});
  }

  void unmount(const URL& url) {
    {
      const std::lock_guard lock(mutex_);
      const auto last = std::find_if(volumes_.rbegin(), volumes_.rend(),
                                     [&](const auto& volume) { return volume.url == url; });
      if (last != volumes_.rend()) volumes_.erase(std::next(last).base());
    }
    announce({.kind = VolumeChange::Kind::unmounted, .volumeURL = url});
  }

  /// Without events.
  void setPseudoFileSystems(std::vector<URL> folders) {
    const std::lock_guard lock(mutex_);
    pseudoFileSystems_ = std::move(folders);
  }

  /// Calls the handlers of all subscriptions; the list stays as it is.
  void announce(const VolumeChange& change) const {
    const std::lock_guard lock(subscribers_->mutex);
    for (const auto& [id, handler] : subscribers_->handlers) handler(change);
  }

  /// The name of a volume; without one, its folder's name serves.
  void setVolumeName(const URL& url, std::string name) {
    const std::lock_guard lock(mutex_);
    names_.insert_or_assign(url, std::move(name));
  }

  /// What `volumeURL` fails with; none lets it succeed again.
  void setLookupError(std::optional<PlatformError> error) {
    const std::lock_guard lock(mutex_);
    lookupError_ = std::move(error);
  }

  /// Without events, `subscribe` answers null.
  void setOffersEvents(bool offersEvents) {
    const std::lock_guard lock(mutex_);
    offersEvents_ = offersEvents;
  }

  [[nodiscard]] std::size_t subscriptionCount() const {
    const std::lock_guard lock(subscribers_->mutex);
    return subscribers_->handlers.size();
  }

  std::vector<MountedVolume> mountedVolumes() override {
    if (faults->strikes()) return {};
    const std::lock_guard lock(mutex_);
    // What is mounted over another volume hides it.
    std::vector<MountedVolume> visible;
    std::set<URL> urls;
    for (auto volume = volumes_.rbegin(); volume != volumes_.rend(); ++volume)
      if (urls.insert(volume->url).second) visible.push_back(*volume);
    std::reverse(visible.begin(), visible.end());
    return visible;
  }

  std::vector<URL> pseudoFileSystems() override {
    if (faults->strikes()) return {};
    const std::lock_guard lock(mutex_);
    return pseudoFileSystems_;
  }

  /// The volume with the longest path that is a folder above the URL, or the URL itself. Absent
  /// where a pseudo file system lies nearer.
  Result<std::optional<URL>> volumeURL(const URL& url) override {
    const Fault fault = faults->nextInTime();
    if (fault == Fault::fails) return PlatformError(std::make_error_code(std::errc::io_error));
    if (fault == Fault::absent) return std::optional<URL>();
    const std::lock_guard lock(mutex_);
    if (lookupError_) return *lookupError_;
    std::string path = url.path();
    if (path.empty() || path.find('\0') != std::string::npos)
      return PlatformError(std::make_error_code(std::errc::no_such_file_or_directory));
    path = withSlash(std::move(path));
    std::optional<URL> found;
    std::size_t longest = 0;
    for (const MountedVolume& volume : volumes_) {
      const std::string root = withSlash(volume.url.path());
      if (!path.starts_with(root) || root.size() < longest) continue;
      longest = root.size();
      found = volume.url;
    }
    for (const URL& folder : pseudoFileSystems_) {
      const std::string root = withSlash(folder.path());
      if (path.starts_with(root) && root.size() >= longest) return std::optional<URL>();
    }
    return found;
  }

  std::optional<std::string> volumeName(const URL& volumeURL) override {
    if (faults->strikes()) return std::nullopt;
    const std::lock_guard lock(mutex_);
    for (const MountedVolume& volume : volumes_) {
      if (volume.url != volumeURL) continue;
      const auto name = names_.find(volumeURL);
      return name == names_.end() ? volumeURL.lastPathComponent() : name->second;
    }
    return std::nullopt;
  }

  std::unique_ptr<Subscription> subscribe(ChangeHandler handler) override {
    if (faults->strikes()) return nullptr;
    {
      const std::lock_guard lock(mutex_);
      if (!offersEvents_) return nullptr;
    }
    return std::make_unique<FakeSubscription>(subscribers_, std::move(handler));
  }

 private:
  struct Subscribers {
    std::mutex mutex;  ///< Owns the rest, and is held while handlers run.
    std::map<std::size_t, ChangeHandler> handlers;
    std::size_t nextID = 0;
  };

  // Shares the subscribers, and so may outlive the catalogue.
  class FakeSubscription final : public Subscription {
   public:
    FakeSubscription(std::shared_ptr<Subscribers> subscribers, ChangeHandler handler)
        : subscribers_(std::move(subscribers)) {
      const std::lock_guard lock(subscribers_->mutex);
      id_ = subscribers_->nextID++;
      subscribers_->handlers.emplace(id_, std::move(handler));
    }
    ~FakeSubscription() override {
      const std::lock_guard lock(subscribers_->mutex);
      subscribers_->handlers.erase(id_);
    }

   private:
    const std::shared_ptr<Subscribers> subscribers_;
    std::size_t id_ = 0;
  };

  static std::string withSlash(std::string path) {
    if (!path.ends_with('/')) path += '/';
    return path;
  }

  const std::shared_ptr<Subscribers> subscribers_ = std::make_shared<Subscribers>();
  mutable std::mutex mutex_;  ///< Owns what follows; never held while a handler runs.
  std::vector<MountedVolume> volumes_;
  std::vector<URL> pseudoFileSystems_;
  std::map<URL, std::string> names_;
  std::optional<PlatformError> lookupError_;
  bool offersEvents_ = true;
};

}  // namespace Varnel::Platform::Testing
