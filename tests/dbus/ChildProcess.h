#pragma once

#include <sys/types.h>

#include <chrono>
#include <filesystem>
#include <optional>
#include <string>
#include <vector>

namespace bustest {

// A program that a test runs beside itself, with its standard output and standard error going to
// files. The destructor kills it, if it still runs, and waits for it.
class ChildProcess {
 public:
  struct Options {
    // The program first, as a path or a name to look up on PATH.
    std::vector<std::string> arguments;
    std::filesystem::path standardOutput;
    std::filesystem::path standardError;
    // A descriptor of ours that the program receives as descriptor 3.
    std::optional<int> descriptor3 = std::nullopt;
  };

  // Throws std::system_error when the program cannot be started.
  explicit ChildProcess(Options options);
  ~ChildProcess();
  ChildProcess(const ChildProcess&) = delete;
  ChildProcess& operator=(const ChildProcess&) = delete;

  pid_t pid() const { return pid_; }

  // Waits up to `timeout` for the program to end. Answers its exit code, or minus the number of
  // the signal that ended it; empty while it still runs.
  std::optional<int> wait(std::chrono::milliseconds timeout);
  // Sends `signal`, then waits as wait() does.
  std::optional<int> stop(int signal, std::chrono::milliseconds timeout);

  std::string standardOutput() const;
  std::string standardError() const;

 private:
  const Options options_;
  pid_t pid_ = -1;
  std::optional<int> ending_;
};

}  // namespace bustest
