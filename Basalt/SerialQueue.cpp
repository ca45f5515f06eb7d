// SPDX-License-Identifier: MIT
#include <Varnel/Basalt/SerialQueue.h>

#include <atomic>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <mutex>
#include <optional>
#include <system_error>

#include <fmt/format.h>

#include <Varnel/Basalt/Semaphore.h>
#include <Varnel/Basalt/SerialQueueLine.h>
#include <Varnel/Basalt/ThreadID.h>
#include <Varnel/Platform/Concurrency/CurrentThread.h>
#include <Varnel/Platform/Concurrency/StartThread.h>

namespace Basalt {
namespace {

using Runner = SerialQueueLine::Runner;

/// How many brief blocks of others a thread runs when it gives a queue up.
constexpr std::size_t maxBriefBlocks = 16;

constexpr std::size_t cacheLine = 64;

// Without an exception where standard error is closed: the process is to stop.
[[noreturn]] void stop(const char* reason, const std::string& label) {
  std::fputs(fmt::format("{} (queue {})\n", reason, label).c_str(), stderr);
  std::abort();
}

/// Lets a block follow another, if there is one.
void append(Block& first, Block&& second) {
  if (!second) return;
  if (first)
    first = [first = std::move(first), second = std::move(second)]() mutable {
      first();
      second();
    };
  else
    first = std::move(second);
}

constinit thread_local bool hasLostItsWaiter = false;

struct KeptWaiter {
  const std::shared_ptr<Waiter> waiter = std::make_shared<Waiter>();
  ~KeptWaiter() { hasLostItsWaiter = true; }
};

// A thread keeps one waiter for all its waits. What it destroys after the waiter, static objects
// among that, may still wait for a queue.
std::shared_ptr<Waiter> currentWaiter() {
  if (hasLostItsWaiter) return std::make_shared<Waiter>();
  thread_local const KeptWaiter kept;
  return kept.waiter;
}

}  // namespace

// A queue has one owner at a time: a thread that runs a block of it, or the thread to which it is
// being handed, often the queue's own worker. While nobody stands in line, a thread takes the queue
// and gives it up by one exchange of a word each. A thread that joins the line says so in the word;
// the owner then fails to give the queue up, and passes it on.
class SerialQueue::Core final {
 public:
  Core(std::string label, QualityOfService quality) : label_(std::move(label)), quality_(quality) {}

  [[nodiscard]] const std::string& label() const { return label_; }
  [[nodiscard]] bool isCurrent() const {
    return runningThread_.load(std::memory_order_relaxed) == currentThreadID();
  }

  [[nodiscard]] bool hasSubmittedBlocks() const {
    return briefBlockCount_ > 0 || (word_.load(std::memory_order_acquire) & queued);
  }

  void acquire();
  // Aligned so that its speed does not depend on the length of the code before it.
  [[gnu::aligned(cacheLine)]] void release() noexcept;
  void submit(Block&& block);
  void enqueue(Block&& block);
  void afterRelease(Block&& block);
  void close();

 private:
  using Lock = std::unique_lock<std::mutex>;

  using Bits = std::uint32_t;
  static constexpr Bits held = 1;     ///< There is an owner; the owner alone clears this.
  static constexpr Bits queued = 2;   ///< Blocks stand in line. Only while held.
  static constexpr Bits waiting = 4;  ///< Threads stand in line.
  static constexpr Bits closed = 8;   ///< The handle is gone: nobody can submit any more.

  // The transitions. A mark of the line changes together with the line, under the mutex.
  bool take();                  ///< From free to held.
  bool takeOrMark(Bits mark);   ///< From free to held, or from held to held and marked.
  bool takeAndMark(Bits mark);  ///< From either to held and marked.
  bool giveUp();                ///< From held without a mark to free.
  /// From held to held by the next in line, or to free. `mayRun`: how many more brief blocks the
  /// calling thread may run itself.
  std::optional<Block> passOn(Lock lock, std::size_t mayRun) noexcept;

  void acquireSlowly();
  void releaseSlowly(Block& afterRelease) noexcept;
  [[nodiscard]] Bits bitsOfLine() const;
  Block takeBlockFromLine();
  void run(Block&& block) noexcept;
  void runBriefBlocks() noexcept;
  bool startWorker() noexcept;
  void work();

  // On one cache line, with the beginning of `afterRelease_`: all that a hold without rivals uses.
  alignas(cacheLine) std::atomic<Bits> word_ = 0;
  std::atomic<ThreadID> runningThread_ = ThreadID::none;

  // Belong to the owner.
  Block briefBlock_;    ///< What the block that runs has submitted, in turn.
  Block afterRelease_;  ///< What is to be done once the queue is given up.
  std::size_t briefBlockCount_ = 0;

  const std::string label_;
  const QualityOfService quality_;

  std::mutex mutex_;  ///< Owns what follows.
  SerialQueueLine line_;
  bool hasWorker_ = false;
  Semaphore work_;  ///< Signalled when the worker has become the owner.
};

// Taking.

void SerialQueue::Core::acquire() {
  Bits idle = 0;
  if (!word_.compare_exchange_strong(idle, held, std::memory_order_acquire,
                                     std::memory_order_relaxed)) [[unlikely]]
    acquireSlowly();
  runningThread_.store(currentThreadID(), std::memory_order_relaxed);
}

bool SerialQueue::Core::take() {
  Bits word = word_.load(std::memory_order_relaxed);
  while (!(word & held))
    if (word_.compare_exchange_weak(word, word | held, std::memory_order_acquire,
                                    std::memory_order_relaxed))
      return true;
  return false;
}

bool SerialQueue::Core::takeOrMark(Bits mark) {
  Bits word = word_.load(std::memory_order_relaxed);
  while (!word_.compare_exchange_weak(word, word | (word & held ? mark : held),
                                      std::memory_order_acquire, std::memory_order_relaxed)) {
  }
  return !(word & held);
}

bool SerialQueue::Core::takeAndMark(Bits mark) {
  return !(word_.fetch_or(mark | held, std::memory_order_acquire) & held);
}

// Giving up.

void SerialQueue::Core::release() noexcept {
  if (briefBlock_) runBriefBlocks();
  Block afterRelease = std::move(afterRelease_);
  if (!giveUp()) [[unlikely]]
    releaseSlowly(afterRelease);
  // From here on the queue may be gone.
  if (afterRelease) afterRelease();
}

bool SerialQueue::Core::giveUp() {
  runningThread_.store(ThreadID::none, std::memory_order_relaxed);
  Bits alone = held;
  return word_.compare_exchange_strong(alone, 0, std::memory_order_release,
                                       std::memory_order_relaxed);
}

// The brief blocks that are next run here first. They may add to what follows the release.
void SerialQueue::Core::releaseSlowly(Block& afterRelease) noexcept {
  std::size_t mayRun = maxBriefBlocks;
  do {
    std::optional<Block> block = passOn(Lock(mutex_), mayRun);
    if (!block) return;
    --mayRun;
    run(std::move(*block));
    runBriefBlocks();
    append(afterRelease, std::move(afterRelease_));
  } while (!giveUp());
}

// A block that is next and that the calling thread may run is returned: the thread stays the owner.
std::optional<Block> SerialQueue::Core::passOn(Lock lock, std::size_t mayRun) noexcept {
  if (line_.isEmpty()) {
    if (!(word_.load(std::memory_order_relaxed) & closed)) {
      word_.store(0, std::memory_order_release);
    } else if (hasWorker_) {
      work_.signal();
    } else {
      lock.unlock();
      delete this;
    }
  } else if (line_.front().thread) {
    const std::shared_ptr<Waiter> thread = line_.pop().thread;
    // Blocks behind the thread keep their order: it becomes the owner. Otherwise the queue stays
    // free for newcomers until the thread has woken up. That is worth more than the order of
    // threads that nothing orders.
    thread->ownsQueue = line_.hasBlocks();
    word_.store(bitsOfLine() | (thread->ownsQueue ? held : 0), std::memory_order_release);
    lock.unlock();
    thread->wake.signal();
  } else if ((line_.front().runner == Runner::worker || mayRun == 0) && startWorker()) {
    // Under the mutex, which the worker needs before it can delete the queue.
    work_.signal();
  } else {
    return takeBlockFromLine();
  }
  return std::nullopt;
}

// For the owner, who stores the word without an exchange: nobody marks it without the mutex, and
// nobody takes the queue while it is held.
SerialQueue::Core::Bits SerialQueue::Core::bitsOfLine() const {
  return (word_.load(std::memory_order_relaxed) & closed) | (line_.hasBlocks() ? queued : 0) |
         (line_.hasThreads() ? waiting : 0);
}

Block SerialQueue::Core::takeBlockFromLine() {
  Block block = line_.pop().block;
  word_.store(bitsOfLine() | held, std::memory_order_relaxed);
  return block;
}

// Waiting.

void SerialQueue::Core::acquireSlowly() {
  if (isCurrent()) stop("A block waits for the queue that it runs on", label_);
  const std::shared_ptr<Waiter> thread = currentWaiter();
  // A thread that was woken in vain keeps its place at the front.
  for (auto place = SerialQueueLine::Place::back; !take(); place = SerialQueueLine::Place::front) {
    {
      const std::lock_guard lock(mutex_);
      if (takeOrMark(waiting)) return;
      thread->ownsQueue = false;
      line_.add({.block = {}, .thread = thread}, place);
    }
    thread->wake.wait();
    if (thread->ownsQueue) return;
  }
}

// Blocks.

void SerialQueue::Core::submit(Block&& block) {
  const bool isInBlock = isCurrent();
  const bool isQueued = word_.load(std::memory_order_acquire) & queued;
  if (isInBlock && !isQueued && briefBlockCount_ < maxBriefBlocks) {
    append(briefBlock_, std::move(block));
    ++briefBlockCount_;
    return;
  }
  if (isInBlock || !take()) {
    const std::lock_guard lock(mutex_);
    if (!takeOrMark(queued)) {
      line_.add({.block = std::move(block)});
      return;
    }
  }
  run(std::move(block));
  release();
}

void SerialQueue::Core::run(Block&& block) noexcept {
  runningThread_.store(currentThreadID(), std::memory_order_relaxed);
  block();
  block = Block();
}

void SerialQueue::Core::runBriefBlocks() noexcept {
  while (briefBlock_) {
    Block block = std::move(briefBlock_);
    block();
  }
  briefBlockCount_ = 0;
}

void SerialQueue::Core::afterRelease(Block&& block) {
  if (!isCurrent()) stop("Only a block of the queue may act after it", label_);
  append(afterRelease_, std::move(block));
}

void SerialQueue::Core::enqueue(Block&& block) {
  Lock lock(mutex_);
  if (!startWorker())
    throw std::system_error(std::make_error_code(std::errc::resource_unavailable_try_again));
  line_.add({.block = std::move(block), .runner = Runner::worker});
  if (takeAndMark(queued)) passOn(std::move(lock), 0);
}

// Under the mutex.
bool SerialQueue::Core::startWorker() noexcept try {
  if (!hasWorker_) Varnel::Platform::startThread(label_, [this] { work(); }).detach();
  return hasWorker_ = true;
} catch (const std::system_error&) {
  return false;
}

void SerialQueue::Core::work() {
  Varnel::Platform::setCurrentThreadQuality(quality_);
  for (;;) {
    work_.wait();
    Lock lock(mutex_);
    if (line_.isEmpty()) break;
    // A thread that was woken in vain may have gone before the block meanwhile.
    if (line_.front().thread) {
      passOn(std::move(lock), 0);
      continue;
    }
    Block block = takeBlockFromLine();
    lock.unlock();
    run(std::move(block));
    release();
  }
  delete this;
}

void SerialQueue::Core::close() {
  Lock lock(mutex_);
  if (takeAndMark(closed)) passOn(std::move(lock), 0);
}

// The handle.

SerialQueue::SerialQueue(std::string label, QualityOfService quality)
    : core_(new Core(std::move(label), quality)) {}

SerialQueue::~SerialQueue() {
  core_->close();
}

const std::string& SerialQueue::label() const {
  return core_->label();
}

void SerialQueue::async(Block&& block) {
  core_->enqueue(std::move(block));
}

void SerialQueue::submit(Block&& block) {
  core_->submit(std::move(block));
}

void SerialQueue::afterRelease(Block&& block) {
  core_->afterRelease(std::move(block));
}

bool SerialQueue::hasSubmittedBlocks() const {
  return core_->hasSubmittedBlocks();
}

bool SerialQueue::isCurrent() const {
  return core_->isCurrent();
}

SerialQueue::Hold::Hold(Core& core) : core_(core) {
  core_.acquire();
}

SerialQueue::Hold::~Hold() {
  core_.release();
}

std::shared_ptr<SerialQueue> QNBuildInternalDispatchQueue(std::string label) {
  return std::make_shared<SerialQueue>(std::move(label));
}

void QNAssertOnQueue(const SerialQueue& queue) {
  if (!queue.isCurrent()) stop("Code ran off the queue that it belongs to", queue.label());
}

}  // namespace Basalt
