#include "ChildProcess.h"

#include <fcntl.h>
#include <spawn.h>
#include <sys/wait.h>

#include <csignal>
#include <system_error>
#include <thread>

#include "Files.h"

extern char** environ;

namespace bustest {

namespace {

using namespace std::chrono_literals;

void check(int error, const char* doing) {
  if (error != 0) throw std::system_error(error, std::generic_category(), doing);
}

// Owns posix_spawn's list of descriptor changes.
class FileActions {
 public:
  FileActions() { check(posix_spawn_file_actions_init(&actions_), "posix_spawn_file_actions"); }
  ~FileActions() { posix_spawn_file_actions_destroy(&actions_); }
  FileActions(const FileActions&) = delete;
  FileActions& operator=(const FileActions&) = delete;

  void open(int descriptor, const std::filesystem::path& path) {
    check(posix_spawn_file_actions_addopen(&actions_, descriptor, path.c_str(),
                                           O_WRONLY | O_CREAT | O_TRUNC, 0644),
          "posix_spawn_file_actions_addopen");
  }
  // Also when `from` is `to`: the copy then merely loses close-on-exec.
  void duplicate(int from, int to) {
    check(posix_spawn_file_actions_adddup2(&actions_, from, to),
          "posix_spawn_file_actions_adddup2");
  }
  const posix_spawn_file_actions_t* get() const { return &actions_; }

 private:
  posix_spawn_file_actions_t actions_{};
};

std::optional<int> endingOf(int status) {
  if (WIFEXITED(status)) return WEXITSTATUS(status);
  if (WIFSIGNALED(status)) return -WTERMSIG(status);
  return std::nullopt;
}

}  // namespace

ChildProcess::ChildProcess(Options options) : options_(std::move(options)) {
  FileActions actions;
  actions.open(STDIN_FILENO, "/dev/null");
  actions.open(STDOUT_FILENO, options_.standardOutput);
  actions.open(STDERR_FILENO, options_.standardError);
  if (options_.descriptor3) actions.duplicate(*options_.descriptor3, 3);

  std::vector<char*> argv;
  for (const std::string& argument : options_.arguments) {
    argv.push_back(const_cast<char*>(argument.c_str()));
  }
  argv.push_back(nullptr);
  check(posix_spawnp(&pid_, argv[0], actions.get(), nullptr, argv.data(), environ),
        options_.arguments.front().c_str());
}

ChildProcess::~ChildProcess() {
  if (ending_) return;
  ::kill(pid_, SIGKILL);
  int status = 0;
  ::waitpid(pid_, &status, 0);
}

std::optional<int> ChildProcess::wait(std::chrono::milliseconds timeout) {
  const auto deadline = std::chrono::steady_clock::now() + timeout;
  while (!ending_) {
    int status = 0;
    const pid_t waited = ::waitpid(pid_, &status, WNOHANG);
    if (waited == pid_) {
      ending_ = endingOf(status);
    } else if (std::chrono::steady_clock::now() >= deadline) {
      break;
    } else {
      std::this_thread::sleep_for(10ms);
    }
  }
  return ending_;
}

std::optional<int> ChildProcess::stop(int signal, std::chrono::milliseconds timeout) {
  if (!ending_) ::kill(pid_, signal);
  return wait(timeout);
}

std::string ChildProcess::standardOutput() const {
  return contentsOf(options_.standardOutput);
}

std::string ChildProcess::standardError() const {
  return contentsOf(options_.standardError);
}

}  // namespace bustest
