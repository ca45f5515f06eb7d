// SPDX-License-Identifier: MIT
#include <system_error>

#include <Varnel/Platform/Bare/Adapters.h>
#include <Varnel/Platform/Ports/DeviceRegistry.h>
#include <Varnel/Platform/Ports/DiskArbitration.h>
#include <Varnel/Platform/Ports/ExtendedAttributes.h>
#include <Varnel/Platform/Ports/MachineIdentity.h>
#include <Varnel/Platform/Ports/ProcessLauncher.h>
#include <Varnel/Platform/Ports/ReadingPriority.h>
#include <Varnel/Platform/Ports/SessionBoard.h>
#include <Varnel/Platform/Ports/SoundPlayer.h>
#include <Varnel/Platform/Ports/Trash.h>
#include <Varnel/Platform/Ports/Workspace.h>

namespace Varnel::Platform::Bare {
namespace {

std::error_code notSupported() {
  return std::make_error_code(std::errc::not_supported);
}

class NoDeviceRegistry final : public DeviceRegistry {
 public:
  std::optional<Entries> entriesMatchingProperty(std::string_view, const PropertyValue&) override {
    return std::nullopt;
  }
};

class NoDiskArbitration final : public DiskArbitration {
 public:
  std::unique_ptr<Session> openSession() override { return nullptr; }
};

class NoExtendedAttributes final : public ExtendedAttributes {
 public:
  Result<std::optional<std::string>, std::error_code> value(const std::string&,
                                                            const std::string&) override {
    return notSupported();
  }
};

class NoMachineIdentity final : public MachineIdentity {
 public:
  std::optional<PropertyValue> platformProperty(std::string_view) const override {
    return std::nullopt;
  }
  std::vector<PropertyData> primaryInterfaceAddresses() const override { return {}; }
};

class NoProcessLauncher final : public ProcessLauncher {
 public:
  Result<std::unique_ptr<LaunchedProcess>, std::error_code> launch(
      const std::string&, const std::vector<std::string>&) override {
    return notSupported();
  }
};

class NoReadingPriority final : public ReadingPriority {
 public:
  std::optional<Level> current() override { return std::nullopt; }
  std::optional<Level> ofMainThread() override { return std::nullopt; }
  void set(Level) override {}
  Level lowered(Level normal) override { return normal; }
};

class NoSessionBoard final : public SessionBoard {
 public:
  std::unique_ptr<Place> takePlace(const std::string&, unsigned, Wait) override {
    return std::make_unique<Place>();
  }
  std::error_code post(std::string_view) override { return notSupported(); }
  void withdraw() override {}
  std::vector<Note> notes() override { return {}; }
};

class NoSoundPlayer final : public SoundPlayer {
 public:
  std::shared_ptr<PlayableSound> load(std::string) override { return nullptr; }
  std::optional<std::string> missingPart() const override { return "this system has no sounds"; }
};

class NoTrash final : public Trash {
 public:
  Result<FileState, TrashError> state(const std::string&) override { return none_; }
  bool isInTrash(const std::string&) override { return false; }
  Result<std::string, TrashError> folderFor(const std::string&) override { return none_; }
  Result<TrashedFile, TrashError> move(const std::string&, const FileState&,
                                       const Ready&) override {
    return none_;
  }
  std::optional<TrashError> restore(const TrashedFile&, Folders) override { return none_; }
  Result<std::vector<TrashedFile>, TrashError> contents(const std::string&) override {
    return none_;
  }

 private:
  const TrashError none_{.reason = TrashError::Reason::noTrash, .code = notSupported()};
};

class NoWorkspace final : public Workspace {
 public:
  std::optional<URL> applicationURL(const std::string&) override { return std::nullopt; }
};

}  // namespace

std::unique_ptr<DeviceRegistry> noDeviceRegistry() {
  return std::make_unique<NoDeviceRegistry>();
}
std::unique_ptr<DiskArbitration> noDiskArbitration() {
  return std::make_unique<NoDiskArbitration>();
}
std::unique_ptr<ExtendedAttributes> noExtendedAttributes() {
  return std::make_unique<NoExtendedAttributes>();
}
std::unique_ptr<MachineIdentity> noMachineIdentity() {
  return std::make_unique<NoMachineIdentity>();
}
std::unique_ptr<ProcessLauncher> noProcessLauncher() {
  return std::make_unique<NoProcessLauncher>();
}
std::unique_ptr<ReadingPriority> noReadingPriority() {
  return std::make_unique<NoReadingPriority>();
}
std::unique_ptr<SessionBoard> noSessionBoard() {
  return std::make_unique<NoSessionBoard>();
}

std::unique_ptr<SoundPlayer> noSoundPlayer() {
  return std::make_unique<NoSoundPlayer>();
}
std::unique_ptr<Trash> noTrash() {
  return std::make_unique<NoTrash>();
}
std::unique_ptr<Workspace> noWorkspace() {
  return std::make_unique<NoWorkspace>();
}

}  // namespace Varnel::Platform::Bare
