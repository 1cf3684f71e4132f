#include "ui/Bundle.h"

#include <system_error>
#include <utility>

namespace ui {

Bundle::Bundle(std::vector<std::filesystem::path> folders) : folders_(std::move(folders)) {}

const Bundle& Bundle::mainBundle() {
  static const Bundle bundle = [] {
    std::error_code error;
    const std::filesystem::path program = std::filesystem::read_symlink("/proc/self/exe", error);
    if (error) return Bundle({});
    const std::filesystem::path folder = program.parent_path();
    return Bundle(
        {folder / "resources", folder.parent_path() / "share" / program.filename() / "resources"});
  }();
  return bundle;
}

std::optional<std::string> Bundle::pathForResource(std::string_view name,
                                                   std::string_view type) const {
  std::string file(name);
  file += '.';
  file += type;
  for (const std::filesystem::path& folder : folders_) {
    const std::filesystem::path candidate = folder / file;
    std::error_code error;
    if (std::filesystem::is_regular_file(candidate, error)) return candidate.string();
  }
  return std::nullopt;
}

}  // namespace ui
