#pragma once

#include <memory>
#include <string>
#include <string_view>

namespace exporting {

// Where an export writes its bytes: a file, or standard output. Bytes gather in memory and go
// out in writes of 64 KiB, when a commit asks for it, and at close().
class OutputFile {
 public:
  // Empty, with `error` saying why, when the file cannot be created. "-" is standard output,
  // taken over whole: from then on anything else written to standard output (log lines)
  // goes to standard error, so that the output holds nothing but the export's bytes.
  static std::unique_ptr<OutputFile> open(std::string_view path, std::string& error);

  ~OutputFile();
  OutputFile(const OutputFile&) = delete;
  OutputFile& operator=(const OutputFile&) = delete;

  // The bytes not yet written, to append to in place; commit() then writes them once enough
  // have gathered, or at once when asked to. False once writing has failed (a full disk, a
  // reader that went away); whatever comes after that is dropped.
  std::string& pending() { return buffer_; }
  bool commit(bool now = false);
  void append(std::string_view bytes) {
    buffer_.append(bytes);
    commit();
  }
  // Writes what is pending and closes; false, with `error` saying so, when anything written
  // was lost.
  bool close(std::string& error);
  const std::string& name() const { return name_; }

 private:
  static constexpr std::size_t kWriteAtBytes = 64 * 1024;

  OutputFile(int descriptor, std::string name) : descriptor_(descriptor), name_(std::move(name)) {}

  int descriptor_;
  std::string name_;
  std::string buffer_;
  bool failed_ = false;
};

}  // namespace exporting
