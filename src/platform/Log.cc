#include "platform/Log.h"

#include <syslog.h>
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <chrono>
#include <climits>
#include <condition_variable>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <mutex>
#include <stdexcept>
#include <thread>
#include <utility>

namespace platform::log {

namespace {

bool isTerminal(std::FILE* output) {
  return isatty(fileno(output)) == 1;
}

enum class Channel : std::uint8_t { Plain, System, Warning };

// One line on its way out: `text`, or for a described line `prefix` followed by the text form of
// `described`, made when written.
struct Line {
  Channel channel = Channel::Plain;
  std::string text;
  std::string_view prefix;
  std::shared_ptr<const Dictionary> described;
};

}  // namespace

struct Channels {
  std::mutex mutex;
  std::vector<Capture*> captures;  // the innermost last
  bool systemLogOpen = false;
  std::FILE* plainOutput = stdout;
  bool plainInteractive = isTerminal(stdout);
  bool plainUnflushed = false;

  static Channels& instance() {
    // Never destroyed, so that lines written while other static objects are destroyed
    // still find it.
    static Channels* const channels = new Channels;
    return *channels;
  }

  void write(Channel channel, std::string_view line) {
    const std::lock_guard lock(mutex);
    if (!captures.empty()) {
      Capture& capture = *captures.back();
      (channel == Channel::Plain ? capture.plainLines_ : capture.systemLines_).emplace_back(line);
      return;
    }
    switch (channel) {
      case Channel::Plain:
        writeToPlainOutput(line);
        break;
      case Channel::Warning:
        writeToStandardError(line);
        writeToSystemLog(line);
        break;
      case Channel::System:
        writeToSystemLog(line);
        break;
    }
  }

  // `scratch` holds the text of a described line.
  void write(const Line& line, std::string& scratch) {
    if (!line.described) {
      write(line.channel, line.text);
      return;
    }
    scratch.assign(line.prefix);
    appendDescription(scratch, *line.described);
    write(line.channel, scratch);
  }

 private:
  void writeToPlainOutput(std::string_view line) {
    // Holding the stream keeps the line whole even next to other writers of the same stream.
    flockfile(plainOutput);
    std::fwrite(line.data(), 1, line.size(), plainOutput);
    std::fputc('\n', plainOutput);
    if (plainInteractive) std::fflush(plainOutput);
    funlockfile(plainOutput);
    plainUnflushed = !plainInteractive;
  }

  static void writeToStandardError(std::string_view line) {
    std::string whole(line);
    whole += '\n';
    // Unbuffered, so that the line is out even if the process is about to end.
    std::fwrite(whole.data(), 1, whole.size(), stderr);
  }

  void writeToSystemLog(std::string_view line) {
    if (!systemLogOpen) {
      openlog("norvo", LOG_PID, LOG_USER);
      systemLogOpen = true;
    }
    const int length = static_cast<int>(std::min<std::size_t>(line.size(), INT_MAX));
    syslog(LOG_NOTICE, "%.*s", length, line.data());
  }
};

namespace {

// The lines waiting for the WriterThread. The writer takes all that wait at once, so at most
// twice the capacity is held: those waiting and those being written.
//
// Lines travel in slots that go back and forth between the writers and the WriterThread: a
// batch once written comes back as the slots of the next lines, whose writers copy their text
// into the storage of the written line's text. So a busy intake does not allocate a line's text,
// nor have it freed on the other thread, where it would fill that thread's cache of freed blocks
// and leave its own empty. The WriterThread lets go of a described line's dictionary once it has
// written the line: the main queue is spared freeing the dictionaries that metrics replace, whose
// memory has gone cold by then. A WriterThread that has had no line for a while lets go of the
// slots' texts.
class LineQueue {
 public:
  static LineQueue& instance() {
    static LineQueue* const queue = new LineQueue;  // never destroyed, like Channels
    return *queue;
  }

  void start(std::size_t capacity) {
    const std::lock_guard lock(mutex_);
    if (running_) throw std::logic_error("one log WriterThread at a time");
    capacity_ = std::max<std::size_t>(capacity, 1);
    running_ = true;
    stopping_ = false;
    writer_ = std::thread([this] { writeUntilStopped(); });
  }

  // Writes out what is queued and ends the writer.
  void stop() {
    std::thread writer;
    {
      const std::lock_guard lock(mutex_);
      stopping_ = true;
      writer = std::move(writer_);
    }
    lineQueued_.notify_one();
    writer.join();
  }

  // False, having queued nothing, when no writer runs: the caller writes the line itself.
  bool push(Channel channel, std::string_view text, std::string_view prefix,
            std::shared_ptr<const Dictionary>&& described) {
    std::unique_lock lock(mutex_);
    if (!running_) return false;
    roomMade_.wait(lock, [this] { return waitingCount_ < capacity_ || !running_; });
    if (!running_) return false;
    if (waitingCount_ == waiting_.size()) waiting_.emplace_back();
    Line& slot = waiting_[waitingCount_++];
    slot.channel = channel;
    // Appending to the emptied text copies it into the storage it has, where assign() would
    // take the general path of replace().
    slot.text.clear();
    slot.text.append(text);
    slot.prefix = prefix;
    slot.described = std::move(described);
    ++queued_;
    const bool wake = writerWaiting_ && (waitingCount_ == 1 || waitingCount_ == hurryAt());
    lock.unlock();
    if (wake) lineQueued_.notify_one();
    return true;
  }

  void drain() {
    std::unique_lock lock(mutex_);
    const std::uint64_t target = queued_;
    if (written_ >= target || !running_) return;
    ++draining_;
    lock.unlock();
    lineQueued_.notify_one();
    lock.lock();
    linesWritten_.wait(lock, [this, target] { return written_ >= target || !running_; });
    --draining_;
  }

 private:
  void writeUntilStopped() {
    Channels& channels = Channels::instance();
    std::vector<Line> batch;
    std::string scratch;
    std::unique_lock lock(mutex_);
    for (;;) {
      writerWaiting_ = true;
      const auto lineOrStop = [this] { return waitingCount_ > 0 || stopping_; };
      if (!lineQueued_.wait_for(lock, kIdleRelease, lineOrStop)) {
        // Quiet for a while: let go of the written lines' texts.
        waiting_.clear();
        lock.unlock();
        batch.clear();
        lock.lock();
        lineQueued_.wait(lock, lineOrStop);
      }
      // Waking for every line would cost the writers more than the lines themselves: the first
      // line waits a little for others to join it, unless the queue fills or someone waits.
      lineQueued_.wait_for(lock, kGathering, [this] {
        return waitingCount_ >= hurryAt() || stopping_ || draining_ > 0;
      });
      writerWaiting_ = false;
      if (waitingCount_ == 0) break;
      batch.swap(waiting_);
      const std::size_t count = std::exchange(waitingCount_, 0);
      lock.unlock();
      roomMade_.notify_all();
      for (std::size_t i = 0; i < count; ++i) {
        channels.write(batch[i], scratch);
        batch[i].described.reset();
      }
      lock.lock();
      written_ += count;
      linesWritten_.notify_all();
    }
    waiting_.clear();
    running_ = false;
    roomMade_.notify_all();
    linesWritten_.notify_all();
  }

  std::size_t hurryAt() const { return (capacity_ + 1) / 2; }

  static constexpr auto kGathering = std::chrono::milliseconds(10);
  static constexpr auto kIdleRelease = std::chrono::seconds(1);

  std::mutex mutex_;
  std::condition_variable lineQueued_;
  std::condition_variable roomMade_;
  std::condition_variable linesWritten_;
  // The first waitingCount_ slots wait; the others are written lines to write over.
  std::vector<Line> waiting_;
  std::size_t waitingCount_ = 0;
  std::size_t capacity_ = 1;
  std::uint64_t queued_ = 0;
  std::uint64_t written_ = 0;
  bool running_ = false;
  bool stopping_ = false;
  bool writerWaiting_ = false;
  int draining_ = 0;
  std::thread writer_;
};

void emit(Channel channel, std::string_view text, std::string_view prefix = {},
          std::shared_ptr<const Dictionary> described = nullptr) {
  if (LineQueue::instance().push(channel, text, prefix, std::move(described))) return;
  if (!described) {
    Channels::instance().write(channel, text);
    return;
  }
  std::string scratch;
  Channels::instance().write(Line{channel, {}, prefix, std::move(described)}, scratch);
}

std::atomic<int> silences{0};

}  // namespace

Silence::Silence() {
  ++silences;
}

Silence::~Silence() {
  --silences;
}

bool silenced() {
  return silences.load(std::memory_order_relaxed) > 0;
}

void plain(std::string_view line) {
  if (!silenced()) emit(Channel::Plain, line);
}

void system(std::string_view line) {
  if (!silenced()) emit(Channel::System, line);
}

void warning(std::string_view line) {
  if (silenced()) return;
  drain();
  Channels::instance().write(Channel::Warning, line);
}

void plainDescribed(std::string_view prefix, std::shared_ptr<const Dictionary> described) {
  if (silenced()) return;
  emit(Channel::Plain, {}, prefix, std::move(described));
}

void setPlainOutput(std::FILE* output) {
  drain();
  Channels& channels = Channels::instance();
  const std::lock_guard lock(channels.mutex);
  if (channels.plainUnflushed) std::fflush(channels.plainOutput);
  channels.plainOutput = output;
  channels.plainInteractive = isTerminal(output);
  channels.plainUnflushed = false;
}

void flushPlain() {
  drain();
  Channels& channels = Channels::instance();
  const std::lock_guard lock(channels.mutex);
  if (!channels.plainUnflushed) return;
  std::fflush(channels.plainOutput);
  channels.plainUnflushed = false;
}

WriterThread::WriterThread(std::size_t capacity) {
  // exit() skips the owner's destructor but not this: the writer is still running then.
  static const bool drainsAtExit = std::atexit([] { drain(); }) == 0;
  (void)drainsAtExit;
  LineQueue::instance().start(capacity);
}

WriterThread::~WriterThread() {
  LineQueue::instance().stop();
}

void drain() {
  LineQueue::instance().drain();
}

Capture::Capture() {
  drain();
  Channels& channels = Channels::instance();
  const std::lock_guard lock(channels.mutex);
  channels.captures.push_back(this);
}

Capture::~Capture() {
  drain();
  Channels& channels = Channels::instance();
  const std::lock_guard lock(channels.mutex);
  std::erase(channels.captures, this);
}

std::vector<std::string> Capture::plainLines() const {
  drain();
  const std::lock_guard lock(Channels::instance().mutex);
  return plainLines_;
}

std::vector<std::string> Capture::systemLines() const {
  drain();
  const std::lock_guard lock(Channels::instance().mutex);
  return systemLines_;
}

std::size_t Capture::count(std::string_view line) const {
  drain();
  const std::lock_guard lock(Channels::instance().mutex);
  const auto countIn = [line](const std::vector<std::string>& lines) {
    return static_cast<std::size_t>(std::count(lines.begin(), lines.end(), line));
  };
  return countIn(plainLines_) + countIn(systemLines_);
}

void Capture::clear() {
  drain();
  const std::lock_guard lock(Channels::instance().mutex);
  plainLines_.clear();
  systemLines_.clear();
}

}  // namespace platform::log
