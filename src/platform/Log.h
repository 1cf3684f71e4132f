#pragma once

#include <cstddef>
#include <cstdio>
#include <string>
#include <string_view>
#include <vector>

#include "platform/Format.h"

// The two diagnostic channels: the plain log on standard output and the system log. Lines may
// come from any thread; each is written whole, with a trailing newline.
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

// While a Capture is alive, the lines of both channels go to it instead of to standard output
// and the system log. Captures nest: the most recent one alive receives the lines.
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
  friend void plain(std::string_view line);
  friend void system(std::string_view line);
  friend void warning(std::string_view line);

  std::vector<std::string> plainLines_;
  std::vector<std::string> systemLines_;
};

}  // namespace platform::log
