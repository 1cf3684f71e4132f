#include "platform/Log.h"

#include <syslog.h>
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <climits>
#include <cstdio>
#include <mutex>

namespace platform::log {

namespace {

bool isTerminal(std::FILE* output) {
  return isatty(fileno(output)) == 1;
}

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
};

void writeToPlainOutput(Channels& channels, std::string_view line) {
  std::FILE* output = channels.plainOutput;
  // Holding the stream keeps the line whole even next to other writers of the same stream.
  flockfile(output);
  std::fwrite(line.data(), 1, line.size(), output);
  std::fputc('\n', output);
  if (channels.plainInteractive) std::fflush(output);
  funlockfile(output);
  channels.plainUnflushed = !channels.plainInteractive;
}

void writeToSystemLog(Channels& channels, std::string_view line) {
  if (!channels.systemLogOpen) {
    openlog("norvo", LOG_PID, LOG_USER);
    channels.systemLogOpen = true;
  }
  const int length = static_cast<int>(std::min<std::size_t>(line.size(), INT_MAX));
  syslog(LOG_NOTICE, "%.*s", length, line.data());
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
  if (silenced()) return;
  Channels& channels = Channels::instance();
  const std::lock_guard lock(channels.mutex);
  if (channels.captures.empty()) {
    writeToPlainOutput(channels, line);
  } else {
    channels.captures.back()->plainLines_.emplace_back(line);
  }
}

void system(std::string_view line) {
  if (silenced()) return;
  Channels& channels = Channels::instance();
  const std::lock_guard lock(channels.mutex);
  if (channels.captures.empty()) {
    writeToSystemLog(channels, line);
  } else {
    channels.captures.back()->systemLines_.emplace_back(line);
  }
}

void setPlainOutput(std::FILE* output) {
  Channels& channels = Channels::instance();
  const std::lock_guard lock(channels.mutex);
  if (channels.plainUnflushed) std::fflush(channels.plainOutput);
  channels.plainOutput = output;
  channels.plainInteractive = isTerminal(output);
  channels.plainUnflushed = false;
}

void flushPlain() {
  Channels& channels = Channels::instance();
  const std::lock_guard lock(channels.mutex);
  if (!channels.plainUnflushed) return;
  std::fflush(channels.plainOutput);
  channels.plainUnflushed = false;
}

void warning(std::string_view line) {
  if (silenced()) return;
  Channels& channels = Channels::instance();
  const std::lock_guard lock(channels.mutex);
  if (!channels.captures.empty()) {
    channels.captures.back()->systemLines_.emplace_back(line);
    return;
  }
  std::string whole(line);
  whole += '\n';
  // Unbuffered, so that the line is out even if the process is about to end.
  std::fwrite(whole.data(), 1, whole.size(), stderr);
  writeToSystemLog(channels, line);
}

Capture::Capture() {
  Channels& channels = Channels::instance();
  const std::lock_guard lock(channels.mutex);
  channels.captures.push_back(this);
}

Capture::~Capture() {
  Channels& channels = Channels::instance();
  const std::lock_guard lock(channels.mutex);
  std::erase(channels.captures, this);
}

std::vector<std::string> Capture::plainLines() const {
  const std::lock_guard lock(Channels::instance().mutex);
  return plainLines_;
}

std::vector<std::string> Capture::systemLines() const {
  const std::lock_guard lock(Channels::instance().mutex);
  return systemLines_;
}

std::size_t Capture::count(std::string_view line) const {
  const std::lock_guard lock(Channels::instance().mutex);
  const auto countIn = [line](const std::vector<std::string>& lines) {
    return static_cast<std::size_t>(std::count(lines.begin(), lines.end(), line));
  };
  return countIn(plainLines_) + countIn(systemLines_);
}

void Capture::clear() {
  const std::lock_guard lock(Channels::instance().mutex);
  plainLines_.clear();
  systemLines_.clear();
}

}  // namespace platform::log
