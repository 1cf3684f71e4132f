#pragma once

#include <fstream>
#include <ostream>
#include <string>

namespace tarn::daemon {

// The file that --record writes, emptied and held under an exclusive lock for as long as this
// lives, so that a second daemon given the same file fails before it clobbers the first one's
// log.
class RecordFile {
 public:
  // Throws std::runtime_error, saying why, when the file cannot be written or is locked.
  explicit RecordFile(const std::string& path);
  ~RecordFile();
  RecordFile(const RecordFile&) = delete;
  RecordFile& operator=(const RecordFile&) = delete;

  std::ostream& stream() { return stream_; }
  // Closes the file; false when anything written to it may have been lost.
  bool close();

 private:
  int lockFd_;
  std::ofstream stream_;
};

}  // namespace tarn::daemon
