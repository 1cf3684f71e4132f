#pragma once

#include <cstddef>
#include <filesystem>
#include <string>

namespace bustest {

// The whole file; empty when it cannot be read.
std::string contentsOf(const std::filesystem::path& path);
// How many lines the file holds, counted by their newlines.
std::size_t lineCount(const std::filesystem::path& path);

}  // namespace bustest
