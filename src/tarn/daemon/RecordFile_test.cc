#include "tarn/daemon/RecordFile.h"

#include <gtest/gtest.h>
#include <unistd.h>

#include <filesystem>
#include <fstream>
#include <sstream>
#include <stdexcept>
#include <string>

namespace tarn::daemon {
namespace {

std::string contentsOf(const std::filesystem::path& path) {
  std::ifstream file(path, std::ios::binary);
  std::ostringstream contents;
  contents << file.rdbuf();
  return contents.str();
}

class RecordFileTest : public ::testing::Test {
 protected:
  ~RecordFileTest() override { std::filesystem::remove(path_); }

  const std::filesystem::path path_ = std::filesystem::temp_directory_path() /
                                      ("norvo-record-" + std::to_string(::getpid()) + ".jsonl");
};

TEST_F(RecordFileTest, EmptiesTheFileAndWritesIt) {
  std::ofstream(path_) << "an older recording\n";
  RecordFile record(path_.string());
  record.stream() << "{}\n";
  EXPECT_TRUE(record.close());
  EXPECT_EQ(contentsOf(path_), "{}\n");
}

TEST_F(RecordFileTest, ASecondRecorderOfTheSameFileFailsWithoutTouchingIt) {
  RecordFile first(path_.string());
  first.stream() << "{}\n" << std::flush;
  try {
    RecordFile second(path_.string());
    FAIL() << "a second recorder took the file";
  } catch (const std::runtime_error& error) {
    EXPECT_NE(std::string(error.what()).find("another process"), std::string::npos) << error.what();
  }
  EXPECT_EQ(contentsOf(path_), "{}\n");
}

}  // namespace
}  // namespace tarn::daemon
