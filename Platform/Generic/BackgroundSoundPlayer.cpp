// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Generic/BackgroundSoundPlayer.h>

#include <atomic>
#include <condition_variable>
#include <deque>
#include <mutex>
#include <system_error>
#include <utility>

#include <Varnel/Platform/Concurrency/StartThread.h>
#include <Varnel/Platform/Generic/SoundKind.h>
#include <Varnel/Platform/Ports/MainQueue.h>

namespace Varnel::Platform {

// Runs jobs one after the other, on a thread that exists while there are jobs.
class BackgroundSoundPlayer::Worker final {
 public:
  /// Given the output; null when there is none.
  using Job = std::function<void(SoundOutput* output)>;

  explicit Worker(OutputMaker makeOutput) : makeOutput_(std::move(makeOutput)) {}
  ~Worker() { waitUntilIdle(); }
  Worker(const Worker&) = delete;
  Worker& operator=(const Worker&) = delete;

  /// False when the system grants no thread: the job then waits for the next one.
  bool post(Job job) try {
    const std::lock_guard lock(mutex_);
    jobs_.push_back(std::move(job));
    if (!isRunning_) startThread("sounds", [this] { run(); }).detach();
    return isRunning_ = true;
  } catch (const std::system_error&) {
    return false;
  }

  void waitUntilIdle() {
    std::unique_lock lock(mutex_);
    becameIdle_.wait(lock, [this] { return !isRunning_; });
  }

 private:
  void run() {
    // Used by this thread alone, and by the threads that follow it.
    if (makeOutput_) output_ = std::exchange(makeOutput_, nullptr)();
    while (Job job = next()) job(output_.get());
  }

  Job next() {
    const std::lock_guard lock(mutex_);
    if (jobs_.empty()) {
      isRunning_ = false;
      becameIdle_.notify_all();
      return nullptr;
    }
    Job job = std::move(jobs_.front());
    jobs_.pop_front();
    return job;
  }

  OutputMaker makeOutput_;
  std::unique_ptr<SoundOutput> output_;
  std::mutex mutex_;  // Owns what follows.
  std::condition_variable becameIdle_;
  std::deque<Job> jobs_;
  bool isRunning_ = false;
};

class BackgroundSoundPlayer::Sound final : public PlayableSound,
                                           public std::enable_shared_from_this<Sound> {
 public:
  Sound(std::string bytes, MainQueue& mainQueue, std::shared_ptr<Worker> worker)
      : bytes_(std::make_shared<std::string>(std::move(bytes))),
        mainQueue_(mainQueue),
        worker_(std::move(worker)) {}
  ~Sound() override { Sound::stop(); }
  Sound(const Sound&) = delete;
  Sound& operator=(const Sound&) = delete;

  void setDelegate(std::weak_ptr<SoundDelegate> delegate) override {
    delegate_ = std::move(delegate);
  }

  void play() override {
    if (isPlaying()) return;
    current_ = std::make_shared<Play>();
    const auto ended = [&queue = mainQueue_, weak = weak_from_this(),
                        play = std::weak_ptr(current_)](bool finished) {
      queue.post([weak, play, finished] {
        if (const auto sound = weak.lock()) sound->end(play.lock(), finished);
      });
    };
    const auto start = [play = current_, bytes = bytes_, ended](SoundOutput* output) {
      if (play->isStopped) return;
      if (output) play->playback = output->start(*bytes, ended);
      if (!play->playback) ended(false);
    };
    if (!worker_->post(start)) ended(false);
  }

  void stop() override {
    const auto play = std::exchange(current_, nullptr);
    if (!play) return;
    play->isStopped = true;
    worker_->post([play](SoundOutput*) { play->playback.reset(); });
  }

  [[nodiscard]] bool isPlaying() const override { return current_ != nullptr; }

 private:
  // From `play` to the end.
  struct Play {
    std::atomic<bool> isStopped = false;
    std::unique_ptr<SoundOutput::Playback> playback;  // The worker's.
  };

  // The end of an earlier play is ignored.
  void end(const std::shared_ptr<Play>& play, bool finished) {
    if (!play || play != current_) return;
    stop();
    if (const auto delegate = delegate_.lock()) delegate->sound(*this, finished);
  }

  const std::shared_ptr<const std::string> bytes_;
  MainQueue& mainQueue_;
  const std::shared_ptr<Worker> worker_;
  // The main thread's.
  std::weak_ptr<SoundDelegate> delegate_;
  std::shared_ptr<Play> current_;
};

BackgroundSoundPlayer::BackgroundSoundPlayer(MainQueue& mainQueue, OutputMaker makeOutput)
    : mainQueue_(mainQueue), worker_(std::make_shared<Worker>(std::move(makeOutput))) {}

BackgroundSoundPlayer::~BackgroundSoundPlayer() {
  worker_->waitUntilIdle();
}

std::shared_ptr<PlayableSound> BackgroundSoundPlayer::load(std::string bytes) {
  if (!looksLikeSound(bytes)) return nullptr;
  return std::make_shared<Sound>(std::move(bytes), mainQueue_, worker_);
}

}  // namespace Varnel::Platform
