#pragma once

#include <cstddef>
#include <cstdio>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "platform/Format.h"
#include "platform/Value.h"

// The two diagnostic channels: the plain log on standard output and the system log. Lines may
// come from any thread; each is written whole, with a trailing newline. Lines written on one
// thread come out in the order written, whether or not a WriterThread writes them.
namespace platform::log {

// While a Silence is alive, the lines of every channel are dropped, before they are even
// formatted: for fuzzing, where millions of inputs each write lines that nobody reads.
class Silence {
 public:
  Silence();
  ~Silence();
  Silence(const Silence&) = delete;
  Silence& operator=(const Silence&) = delete;
};

// Whether a Silence is alive.
bool silenced();

void plain(std::string_view line);
void system(std::string_view line);
// Something a person must see, such as a feature that stopped or data that was lost: written to
// standard error and to the system log, where one is running. A Capture keeps it among its
// system lines.
void warning(std::string_view line);

// The plain line `prefix` followed by the text form of `described`, e.g. "Received CA Status Dict
// is [...]". The text is made where the line is written, on the WriterThread when one runs, so
// `described` must not change any more and `prefix` must stay valid until then (a literal).
void plainDescribed(std::string_view prefix, std::shared_ptr<const Dictionary> described);

template <class... Args>
void plainf(std::string_view pattern, const Args&... arguments) {
  if (!silenced()) plain(format(pattern, arguments...));
}

template <class... Args>
void systemf(std::string_view pattern, const Args&... arguments) {
  if (!silenced()) system(format(pattern, arguments...));
}

template <class... Args>
void warningf(std::string_view pattern, const Args&... arguments) {
  if (!silenced()) warning(format(pattern, arguments...));
}

// Where plain lines go while no Capture is alive: standard output unless told otherwise; the
// caller keeps `output` open from then on. A terminal gets each line at once; a file or a pipe
// gets stdio's buffering, which flushPlain() (or exit) writes out.
void setPlainOutput(std::FILE* output);
// Writes out the plain lines still held in the output's buffer; cheap when there are none.
void flushPlain();

// While a WriterThread is alive, the lines of every channel are queued and written by its
// thread, so that whoever writes a line (the main queue above all) spends no time on making its
// text or on the output. At most `capacity` lines wait: a writer that finds the queue full
// waits for room. No line is dropped, and an output that cannot keep up slows the writers down
// rather than filling memory. A warning first waits for the lines before it, then is written at
// once. One WriterThread at a time; lines still queued when the process exits are written out.
class WriterThread {
 public:
  static constexpr std::size_t kDefaultCapacity = 4096;

  explicit WriterThread(std::size_t capacity = kDefaultCapacity);
  // Writes out every queued line, then ends the thread; later lines are written directly.
  ~WriterThread();
  WriterThread(const WriterThread&) = delete;
  WriterThread& operator=(const WriterThread&) = delete;
};

// Returns once every line written so far has left the queue: it is in the output's buffer (see
// flushPlain), in the system log or in a Capture. Immediate when no WriterThread runs. Not for
// the WriterThread's own thread.
void drain();

// While a Capture is alive, the lines of both channels go to it instead of to standard output
// and the system log. Captures nest: the most recent one alive receives the lines. With a
// WriterThread, a Capture receives the lines written while it is alive: it waits for the
// queue when it begins, ends, and is read.
class Capture {
 public:
  Capture();
  ~Capture();
  Capture(const Capture&) = delete;
  Capture& operator=(const Capture&) = delete;

  std::vector<std::string> plainLines() const;
  std::vector<std::string> systemLines() const;
  // How often the exact line was written, to either channel.
  std::size_t count(std::string_view line) const;
  void clear();

 private:
  friend struct Channels;

  std::vector<std::string> plainLines_;
  std::vector<std::string> systemLines_;
};

}  // namespace platform::log
