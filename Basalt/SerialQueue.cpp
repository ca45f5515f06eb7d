// SPDX-License-Identifier: MIT
#include <Varnel/Basalt/SerialQueue.h>

#include <atomic>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <deque>
#include <mutex>
#include <optional>
#include <system_error>

#include <fmt/format.h>

#include <Varnel/Basalt/Semaphore.h>
#include <Varnel/Basalt/ThreadID.h>
#include <Varnel/Platform/Concurrency/CurrentThread.h>
#include <Varnel/Platform/Concurrency/StartThread.h>

namespace Basalt {
namespace {

/// How many brief blocks of others a thread runs when it gives a queue up.
constexpr std::size_t briefBlockLimit = 16;

constexpr std::size_t cacheLine = 64;

[[noreturn]] void stop(const char* reason, const std::string& label) {
  fmt::print(stderr, "{} (queue {})\n", reason, label);
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

/// Where a thread sleeps that waits for a queue. Shared, as the one that wakes it may still be
/// about it when the thread has gone on.
struct Waiter {
  Semaphore wake;
  bool ownsQueue = false;  ///< Set before the wake-up; otherwise the thread has to try again.
};

constinit thread_local bool hasLostItsWaiter = false;

struct KeptWaiter {
  const std::shared_ptr<Waiter> waiter = std::make_shared<Waiter>();
  KeptWaiter() = default;
  ~KeptWaiter() { hasLostItsWaiter = true; }
  KeptWaiter(const KeptWaiter&) = delete;
  KeptWaiter& operator=(const KeptWaiter&) = delete;
};

// The same for all waits of a thread, until the thread ends: objects that are destroyed later, the
// static ones among them, may still wait for a queue.
std::shared_ptr<Waiter> currentWaiter() {
  if (hasLostItsWaiter) return std::make_shared<Waiter>();
  thread_local const KeptWaiter kept;
  return kept.waiter;
}

}  // namespace

// The queue has one owner at a time: a thread, its own worker, or one to which it is being handed.
// Who finds the word without `held` and `queued` may take it by one compare-and-swap and gives it
// up by another as long as nobody stands in line. Whoever stands in line has said so in the word,
// and makes the owner look: a block is run or handed on in its turn, the queue is handed to a
// thread that has blocks behind it, and else the first thread is woken to try again, since a queue
// that stays free for newcomers meanwhile is worth more than the order of threads that nothing
// orders.
class SerialQueue::Core final {
 public:
  Core(std::string label, QualityOfService quality) : label_(std::move(label)), quality_(quality) {}

  [[nodiscard]] const std::string& label() const { return label_; }
  [[nodiscard]] bool isCurrent() const {
    return holder_.load(std::memory_order_relaxed) == currentThreadID();
  }

  void acquire();
  void release() noexcept;
  void enqueue(Block&& block);
  void submit(Block&& block);
  void afterRelease(Block&& block);
  void close();

 private:
  using Bits = std::uint32_t;
  static constexpr Bits held = 1;     ///< It has an owner.
  static constexpr Bits queued = 2;   ///< Blocks stand in line; newcomers join it. Never unheld.
  static constexpr Bits waiting = 4;  ///< Threads stand in line.
  static constexpr Bits closed = 8;   ///< Nobody can submit any more.

  enum class Runner { anyThread, worker };
  struct Entry {
    Block block;
    Runner runner = Runner::anyThread;
    std::shared_ptr<Waiter> waiter;  ///< A thread instead of a block.
  };

  bool tryTake();
  bool giveUp();
  void releaseSlowly(Block& afterRelease) noexcept;
  bool takeOrMark(Bits mark);
  void acquireSlowly();
  void pushBlock(Block&& block, Runner runner);
  Entry popFront();
  void runBriefBlocks() noexcept;
  std::optional<Block> passOn(std::size_t mayRun) noexcept;
  bool startWorker() noexcept;
  void work();
  [[nodiscard]] Bits bitsOfLine() const;

  // What every hold looks at, on one cache line up to whether there is anything to run after it.
  alignas(cacheLine) std::atomic<Bits> word_ = 0;
  std::atomic<ThreadID> holder_ = ThreadID::none;  ///< Set only while a block runs.

  // Owned by the holder.
  Block briefBlock_;    ///< What the block that runs has submitted, in turn.
  Block afterRelease_;  ///< What is to be done once the queue is given up.
  std::size_t briefBlockCount_ = 0;

  const std::string label_;
  const QualityOfService quality_;

  std::mutex mutex_;  ///< Owns what follows.
  std::deque<Entry> line_;
  std::size_t blocksInLine_ = 0;
  bool hasWorker_ = false;
  Semaphore work_;  ///< Signalled when the worker has become the owner.
};

void SerialQueue::Core::acquire() {
  Bits idle = 0;
  if (!word_.compare_exchange_strong(idle, held, std::memory_order_acquire,
                                     std::memory_order_relaxed)) [[unlikely]]
    acquireSlowly();
  holder_.store(currentThreadID(), std::memory_order_relaxed);
}

bool SerialQueue::Core::tryTake() {
  Bits word = word_.load(std::memory_order_relaxed);
  while (!(word & held))
    if (word_.compare_exchange_weak(word, word | held, std::memory_order_acquire,
                                    std::memory_order_relaxed))
      return true;
  return false;
}

// Under the mutex: takes the queue if it is free, and otherwise makes its owner look at the line.
bool SerialQueue::Core::takeOrMark(Bits mark) {
  Bits word = word_.load(std::memory_order_relaxed);
  while (!word_.compare_exchange_weak(word, word | (word & held ? mark : held),
                                      std::memory_order_acquire, std::memory_order_relaxed)) {
  }
  return !(word & held);
}

void SerialQueue::Core::acquireSlowly() {
  if (isCurrent()) stop("A block waits for the queue that it runs on", label_);
  const std::shared_ptr<Waiter> waiter = currentWaiter();
  for (bool isNew = true; !tryTake(); isNew = false) {
    {
      const std::lock_guard lock(mutex_);
      if (takeOrMark(waiting)) return;
      waiter->ownsQueue = false;
      // Who was woken in vain keeps the place at the front.
      line_.insert(isNew ? line_.end() : line_.begin(), Entry{.block = {}, .waiter = waiter});
    }
    waiter->wake.wait();
    if (waiter->ownsQueue) return;
  }
}

void SerialQueue::Core::release() noexcept {
  if (briefBlock_) runBriefBlocks();
  Block afterRelease = std::move(afterRelease_);
  if (!giveUp()) [[unlikely]]
    releaseSlowly(afterRelease);
  // From here on the queue may be gone.
  if (afterRelease) afterRelease();
}

// Succeeds as long as nobody stands in line.
bool SerialQueue::Core::giveUp() {
  holder_.store(ThreadID::none, std::memory_order_relaxed);
  Bits alone = held;
  return word_.compare_exchange_strong(alone, 0, std::memory_order_release,
                                       std::memory_order_relaxed);
}

// Runs the brief blocks that are next, and passes the queue on. They add to what is to be done
// then.
void SerialQueue::Core::releaseSlowly(Block& afterRelease) noexcept {
  std::size_t mayRun = briefBlockLimit;
  do {
    std::optional<Block> block = passOn(mayRun);
    if (!block) return;
    --mayRun;
    holder_.store(currentThreadID(), std::memory_order_relaxed);
    (*block)();
    block.reset();
    runBriefBlocks();
    append(afterRelease, std::move(afterRelease_));
  } while (!giveUp());
}

void SerialQueue::Core::runBriefBlocks() noexcept {
  while (briefBlock_) {
    Block block = std::move(briefBlock_);
    block();
  }
  briefBlockCount_ = 0;
}

// Gives the queue to whoever is next. The exception is a block that the calling thread may run:
// that is returned, and the caller stays the owner.
std::optional<Block> SerialQueue::Core::passOn(std::size_t mayRun) noexcept {
  std::unique_lock lock(mutex_);
  if (line_.empty()) {
    if (!(word_.load(std::memory_order_relaxed) & closed)) {
      word_.store(0, std::memory_order_release);
    } else if (hasWorker_) {
      work_.signal();
    } else {
      lock.unlock();
      delete this;
    }
    return std::nullopt;
  }
  if (line_.front().waiter) {
    const std::shared_ptr<Waiter> waiter = popFront().waiter;
    waiter->ownsQueue = blocksInLine_ > 0;
    word_.store(bitsOfLine() | (waiter->ownsQueue ? held : 0), std::memory_order_release);
    lock.unlock();
    waiter->wake.signal();
    return std::nullopt;
  }
  const bool isForWorker = line_.front().runner == Runner::worker || mayRun == 0;
  if (isForWorker && startWorker()) {
    // Not after the mutex: the worker may be the last one to use the queue.
    work_.signal();
    return std::nullopt;
  }
  std::optional<Block> block = popFront().block;
  word_.store(bitsOfLine() | held, std::memory_order_relaxed);
  return block;
}

SerialQueue::Core::Entry SerialQueue::Core::popFront() {
  Entry entry = std::move(line_.front());
  line_.pop_front();
  if (!entry.waiter) --blocksInLine_;
  return entry;
}

SerialQueue::Core::Bits SerialQueue::Core::bitsOfLine() const {
  return (word_.load(std::memory_order_relaxed) & closed) | (blocksInLine_ > 0 ? queued : 0) |
         (line_.size() > blocksInLine_ ? waiting : 0);
}

void SerialQueue::Core::pushBlock(Block&& block, Runner runner) {
  line_.push_back({.block = std::move(block), .runner = runner, .waiter = nullptr});
  ++blocksInLine_;
}

void SerialQueue::Core::enqueue(Block&& block) {
  {
    const std::lock_guard lock(mutex_);
    if (!startWorker())
      throw std::system_error(std::make_error_code(std::errc::resource_unavailable_try_again));
    pushBlock(std::move(block), Runner::worker);
    if (word_.fetch_or(queued | held, std::memory_order_acquire) & held) return;
  }
  passOn(0);
}

void SerialQueue::Core::submit(Block&& block) {
  const bool isInBlock = isCurrent();
  const bool isQueued = word_.load(std::memory_order_acquire) & queued;
  if (isInBlock && !isQueued && briefBlockCount_ < briefBlockLimit) {
    append(briefBlock_, std::move(block));
    ++briefBlockCount_;
    return;
  }
  if (isInBlock || !tryTake()) {
    const std::lock_guard lock(mutex_);
    if (!takeOrMark(queued)) {
      pushBlock(std::move(block), Runner::anyThread);
      return;
    }
  }
  holder_.store(currentThreadID(), std::memory_order_relaxed);
  [&]() noexcept { block(); }();
  block = Block();
  release();
}

void SerialQueue::Core::afterRelease(Block&& block) {
  if (!isCurrent()) stop("Only a block of the queue may act after it", label_);
  append(afterRelease_, std::move(block));
}

void SerialQueue::Core::close() {
  {
    const std::lock_guard lock(mutex_);
    if (word_.fetch_or(closed | held, std::memory_order_acquire) & held) return;
  }
  passOn(0);
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
    Block block;
    {
      const std::lock_guard lock(mutex_);
      if (line_.empty()) break;
      // A thread that was woken in vain may have gone before the block meanwhile.
      if (!line_.front().waiter) {
        block = popFront().block;
        word_.store(bitsOfLine() | held, std::memory_order_relaxed);
      }
    }
    if (!block) {
      passOn(0);
      continue;
    }
    holder_.store(currentThreadID(), std::memory_order_relaxed);
    [&]() noexcept { block(); }();
    block = Block();
    release();
  }
  delete this;
}

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
