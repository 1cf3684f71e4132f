#include "Files.h"

#include <algorithm>
#include <fstream>
#include <sstream>

namespace bustest {

std::string contentsOf(const std::filesystem::path& path) {
  std::ifstream file(path, std::ios::binary);
  std::ostringstream contents;
  contents << file.rdbuf();
  return contents.str();
}

std::size_t lineCount(const std::filesystem::path& path) {
  const std::string text = contentsOf(path);
  return static_cast<std::size_t>(std::count(text.begin(), text.end(), '\n'));
}

}  // namespace bustest
