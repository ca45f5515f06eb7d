// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/SessionBoard.h>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <charconv>
#include <chrono>
#include <cstdlib>
#include <filesystem>
#include <future>
#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <system_error>
#include <thread>
#include <utility>

#include <Varnel/Platform/Concurrency/StartThread.h>
#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/POSIX/FileDescriptor.h>
#include <Varnel/Platform/POSIX/LastError.h>
#include <Varnel/Platform/Ports/PrivateFiles.h>
#include <Varnel/Platform/Values/PathComponents.h>
#include <Varnel/Platform/Values/UUID.h>

namespace Varnel::Platform::POSIX {
namespace {

namespace fs = std::filesystem;
using namespace std::chrono_literals;

constexpr mode_t ownerOnly = S_IRUSR | S_IWUSR;

/// A file, some bytes of which are locked. The locks are of the open file description, so that two
/// threads keep one another out as two processes do. A forked child shares the description:
/// therefore the locks are freed, and not left to whoever closes it last.
class LockedFile final {
 public:
  explicit LockedFile(FileDescriptor file) : file_(std::move(file)) {}
  LockedFile(LockedFile&&) = default;
  LockedFile& operator=(LockedFile&&) = default;
  ~LockedFile() { unlockAll(); }

  [[nodiscard]] bool tryLock(short kind, off_t byte) { return set(F_OFD_SETLK, kind, byte, 1); }
  [[nodiscard]] bool lock(off_t byte) {
    while (!set(F_OFD_SETLKW, F_WRLCK, byte, 1))
      if (errno != EINTR) return false;
    return true;
  }
  void unlock(off_t byte) { set(F_OFD_SETLK, F_UNLCK, byte, 1); }
  void unlockAll() {
    if (file_) set(F_OFD_SETLK, F_UNLCK, 0, 0);
  }

  /// Whether another description has locked the first byte, as who reads sees it.
  [[nodiscard]] bool isLockedElsewhere() const {
    struct flock lock = range(F_RDLCK, 0, 1);
    return ::fcntl(file_.get(), F_OFD_GETLK, &lock) == 0 && lock.l_type != F_UNLCK;
  }

  [[nodiscard]] int get() const { return file_.get(); }

 private:
  static struct flock range(short kind, off_t first, off_t length) {
    struct flock lock {};
    lock.l_type = kind;
    lock.l_whence = SEEK_SET;
    lock.l_start = first;
    lock.l_len = length;  // to the end at 0
    return lock;
  }
  bool set(int command, short kind, off_t first, off_t length) {
    struct flock lock = range(kind, first, length);
    return ::fcntl(file_.get(), command, &lock) == 0;
  }

  FileDescriptor file_;
};

/// The first byte is the head of the line: only who has it waits for a place. So a reader that
/// comes back at once gets in behind those that wait, and one alone looks after the places.
class Places final {
 public:
  Places(FileDescriptor file, unsigned count)
      : file_(std::move(file)), count_(static_cast<off_t>(count)) {}

  // Those who only try share the head: they keep out nobody but, for a moment, one who waits.
  [[nodiscard]] bool tryOne() {
    if (!file_.tryLock(F_RDLCK, head)) return false;
    const bool isIn = lockOne();
    file_.unlock(head);
    return isIn;
  }

  // Fails where the file system has no locks.
  [[nodiscard]] bool waitForOne() {
    if (!file_.lock(head)) return false;
    // The system can wait for one place, and for none of several.
    bool isIn = lockOne() || (count_ == 1 && file_.lock(1));
    for (auto pause = 1ms; !isIn; pause = std::min(2 * pause, maxPause)) {
      std::this_thread::sleep_for(pause);
      isIn = lockOne();
    }
    file_.unlock(head);
    return isIn;
  }

  void giveBack() { file_.unlockAll(); }

 private:
  static constexpr off_t head = 0;
  // As long as the turns are that readers give one another.
  static constexpr auto maxPause = 16ms;

  bool lockOne() {
    for (off_t place = 1; place <= count_; ++place)
      if (file_.tryLock(F_WRLCK, place)) return true;
    return false;
  }

  LockedFile file_;
  const off_t count_;
};

class HeldPlace final : public SessionBoard::Place {
 public:
  explicit HeldPlace(std::shared_ptr<Places> places) : places_(std::move(places)) {}
  // The thread that waited for it may still have the file.
  ~HeldPlace() override { places_->giveBack(); }

 private:
  const std::shared_ptr<Places> places_;
};

// Absent when none came free in time. The system knows no end of such a wait: what it gives later
// is given back at once.
std::optional<bool> waitForOne(const std::shared_ptr<Places>& places,
                               std::chrono::milliseconds patience) {
  const auto wait =
      std::make_shared<std::packaged_task<bool()>>([places] { return places->waitForOne(); });
  auto isIn = wait->get_future();
  try {
    startThread("shared-place", [wait] { (*wait)(); }).detach();
  } catch (const std::system_error&) {
    (*wait)();
  }
  if (isIn.wait_for(patience) != std::future_status::ready) return std::nullopt;
  return isIn.get();
}

bool writeAll(int file, std::string_view bytes) {
  while (!bytes.empty()) {
    const ssize_t written = ::write(file, bytes.data(), bytes.size());
    if (written < 0 && errno == EINTR) continue;
    if (written < 0) return false;
    bytes.remove_prefix(static_cast<std::size_t>(written));
  }
  return true;
}

// Absent when the file is longer than any note.
std::optional<std::string> readAll(int file) {
  std::string text;
  for (std::array<char, 4096> buffer{}; text.size() <= SessionBoard::maxNoteSize;) {
    const ssize_t count = ::read(file, buffer.data(), buffer.size());
    if (count < 0 && errno == EINTR) continue;
    if (count < 0) return std::nullopt;
    if (count == 0) return text;
    text.append(buffer.data(), static_cast<std::size_t>(count));
  }
  return std::nullopt;
}

bool isOwnFile(int file) {
  struct stat facts {};
  return ::fstat(file, &facts) == 0 && S_ISREG(facts.st_mode) && facts.st_uid == ::geteuid();
}

bool hasNoName(int file) {
  struct stat facts {};
  return ::fstat(file, &facts) == 0 && facts.st_nlink == 0;
}

/// The board lies in the folder that the session has for what is shared while it lasts.
class RuntimeFolder final : public SessionBoard {
 public:
  RuntimeFolder(PrivateFiles& files, std::chrono::milliseconds patience)
      : files_(files), patience_(patience) {}

  std::unique_ptr<Place> takePlace(const std::string& name, unsigned count, Wait wait) override {
    auto file = openPlaces(name);
    if (!file) return std::make_unique<Place>();
    const auto places = std::make_shared<Places>(std::move(file), std::max(count, 1u));
    if (places->tryOne()) return std::make_unique<HeldPlace>(places);
    // A file system without locks says so, where a lock that is taken says EAGAIN.
    const bool isTaken = errno == EAGAIN || errno == EACCES;
    if (!isTaken || isPassedOver(name)) return std::make_unique<Place>();
    if (wait == Wait::no) return nullptr;
    const auto isIn = waitForOne(places, patience_);
    if (!isIn) passOver(name, places);
    if (!isIn.value_or(false)) return std::make_unique<Place>();
    return std::make_unique<HeldPlace>(places);
  }

  std::error_code post(std::string_view text) override {
    if (text.size() > maxNoteSize) return std::make_error_code(std::errc::file_too_large);
    const fs::path folder = notesFolder();
    if (folder.empty()) return std::make_error_code(std::errc::no_such_file_or_directory);
    if (files_.makeFolders(folder)) return std::make_error_code(std::errc::permission_denied);
    const std::lock_guard lock(mutex_);
    const std::string path = folder / (std::to_string(::getpid()) + "." + name_);
    const std::string half = path + ".new";
    LockedFile note(FileDescriptor(
        ::open(half.c_str(), O_RDWR | O_CREAT | O_EXCL | O_NOFOLLOW | O_CLOEXEC, ownerOnly)));
    const bool isWritten = note.get() >= 0 && note.tryLock(F_WRLCK, 0) &&
                           ::fchmod(note.get(), ownerOnly) == 0 && writeAll(note.get(), text) &&
                           ::rename(half.c_str(), path.c_str()) == 0;
    if (!isWritten) {
      const std::error_code why = lastError();
      ::unlink(half.c_str());
      return why;
    }
    note_ = Posted{path, std::move(note)};
    return {};
  }

  void withdraw() override {
    const std::lock_guard lock(mutex_);
    if (note_) ::unlink(note_->path.c_str());
    note_.reset();
  }

  std::vector<Note> notes() override {
    std::vector<Note> notes;
    std::error_code error;
    for (fs::directory_iterator each(notesFolder(), error), end;
         !error && each != end && notes.size() < maxNotes; each.increment(error))
      if (auto text = textOf(each->path()))
        notes.push_back({processOf(each->path().filename().string()), std::move(*text)});
    return notes;
  }

 private:
  struct Posted {
    std::string path;
    LockedFile file;
  };
  static constexpr std::size_t maxNotes = 1000;

  // Who has a place, or is the first in line, may have been stopped. The wait that nobody waits for
  // any more ends when that process goes on, and till then is the only one.
  void passOver(const std::string& name, const std::shared_ptr<Places>& waiting) {
    const std::lock_guard lock(mutex_);
    passedOver_[name] = waiting;
  }
  [[nodiscard]] bool isPassedOver(const std::string& name) {
    const std::lock_guard lock(mutex_);
    const auto found = passedOver_.find(name);
    return found != passedOver_.end() && !found->second.expired();
  }

  // Empty where the session has none.
  static fs::path runtimeFolder() {
    const char* value = std::getenv("XDG_RUNTIME_DIR");
    return value && *value == '/' ? fs::path(value) / "varnel" : fs::path();
  }
  static fs::path notesFolder() {
    const fs::path folder = runtimeFolder();
    return folder.empty() ? folder : folder / "processes";
  }

  // Files of such a folder may be removed when nobody has touched them for hours, which the sticky
  // bit forbids. Who has locked one that was removed would keep nobody out.
  FileDescriptor openPlaces(const std::string& name) {
    const fs::path folder = runtimeFolder();
    if (folder.empty()) return {};
    const auto path = files_.prepare(folder / "places" / fileNameFor(name));
    if (!path) return {};
    FileDescriptor file(::open(path->c_str(), O_RDWR | O_NOFOLLOW | O_CLOEXEC));
    if (file) static_cast<void>(::fchmod(file.get(), ownerOnly | S_ISVTX));
    return file;
  }

  static std::int64_t processOf(std::string_view name) {
    std::int64_t process = 0;
    std::from_chars(name.data(), name.data() + name.size(), process);
    return process;
  }

  // Absent when its process has ended, or it is no note. That of a process which was killed is
  // taken away.
  static std::optional<std::string> textOf(const fs::path& path, bool isAgain = false) {
    const LockedFile note(
        FileDescriptor(::open(path.c_str(), O_RDONLY | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC)));
    if (note.get() < 0 || !isOwnFile(note.get())) return std::nullopt;
    if (note.isLockedElsewhere())
      return path.extension() == ".new" ? std::nullopt : readAll(note.get());
    // Its process lives, and has posted the next one or withdrawn it.
    if (hasNoName(note.get())) return isAgain ? std::nullopt : textOf(path, true);
    ::unlink(path.c_str());
    return std::nullopt;
  }

  PrivateFiles& files_;
  const std::chrono::milliseconds patience_;
  const std::string name_ = randomUUIDString();
  std::mutex mutex_;  ///< Owns what follows.
  std::optional<Posted> note_;
  std::map<std::string, std::weak_ptr<Places>> passedOver_;  ///< As long as they are waited for.
};

}  // namespace

std::unique_ptr<SessionBoard> makeSessionBoard(PrivateFiles& files,
                                               std::chrono::milliseconds patience) {
  return std::make_unique<RuntimeFolder>(files, patience);
}

}  // namespace Varnel::Platform::POSIX
