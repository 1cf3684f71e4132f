#include "tarn/daemon/RecordFile.h"

#include <fcntl.h>
#include <sys/file.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <stdexcept>

namespace tarn::daemon {

namespace {

int openLocked(const std::string& path) {
  const int fd = ::open(path.c_str(), O_WRONLY | O_CREAT | O_CLOEXEC, 0666);
  if (fd < 0) throw std::runtime_error("cannot write " + path + ": " + std::strerror(errno));
  if (::flock(fd, LOCK_EX | LOCK_NB) != 0) {
    const int error = errno;
    ::close(fd);
    throw std::runtime_error(error == EWOULDBLOCK
                                 ? path + " is being recorded by another process"
                                 : "cannot lock " + path + ": " + std::strerror(error));
  }
  return fd;
}

}  // namespace

RecordFile::RecordFile(const std::string& path)
    : lockFd_(openLocked(path)), stream_(path, std::ios::binary | std::ios::trunc) {
  if (!stream_) {
    ::close(lockFd_);
    throw std::runtime_error("cannot write " + path);
  }
}

RecordFile::~RecordFile() {
  ::close(lockFd_);
}

bool RecordFile::close() {
  stream_.close();
  return !stream_.fail();
}

}  // namespace tarn::daemon
