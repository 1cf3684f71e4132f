#include "export/OutputFile.h"

#include <fcntl.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <cstdio>
#include <cstring>

namespace exporting {

namespace {

// The descriptor that was standard output, with standard output itself sent to standard error.
int takeStandardOutput() {
  std::fflush(stdout);
  const int data = fcntl(STDOUT_FILENO, F_DUPFD_CLOEXEC, 3);
  if (data < 0) return -1;
  if (dup2(STDERR_FILENO, STDOUT_FILENO) < 0) {
    ::close(data);
    return -1;
  }
  return data;
}

}  // namespace

std::unique_ptr<OutputFile> OutputFile::open(std::string_view path, std::string& error) {
  // A reader that goes away (`| head`) shows as a failed write, not as a killed process.
  std::signal(SIGPIPE, SIG_IGN);
  std::string name(path);
  int descriptor = -1;
  if (path == "-") {
    name = "standard output";
    descriptor = takeStandardOutput();
  } else {
    descriptor = ::open(name.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0666);
  }
  if (descriptor < 0) {
    error = "cannot write " + name + " (" + std::strerror(errno) + ")";
    return nullptr;
  }
  return std::unique_ptr<OutputFile>(new OutputFile(descriptor, std::move(name)));
}

OutputFile::~OutputFile() {
  if (descriptor_ >= 0) ::close(descriptor_);
}

bool OutputFile::commit(bool now) {
  if (!now && buffer_.size() < kWriteAtBytes) return !failed_;
  std::string_view rest = buffer_;
  while (!failed_ && !rest.empty()) {
    const ssize_t written = ::write(descriptor_, rest.data(), rest.size());
    if (written < 0 && errno == EINTR) continue;
    if (written <= 0) {
      failed_ = true;
    } else {
      rest.remove_prefix(static_cast<std::size_t>(written));
    }
  }
  buffer_.clear();
  return !failed_;
}

bool OutputFile::close(std::string& error) {
  if (descriptor_ >= 0) {
    commit(true);
    if (::close(descriptor_) != 0) failed_ = true;
    descriptor_ = -1;
  }
  if (failed_) error = "cannot write " + name_;
  return !failed_;
}

}  // namespace exporting
