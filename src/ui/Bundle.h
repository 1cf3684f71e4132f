#pragma once

#include <filesystem>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace ui {

// Where an app's resources are: files looked up by name and type (the file extension).
class Bundle {
 public:
  // Looks in `folders`, in order.
  explicit Bundle(std::vector<std::filesystem::path> folders);

  // The running program's: "resources" beside the program, then share/<program>/resources
  // beside the folder that holds it (the installed layout).
  static const Bundle& mainBundle();

  // The full path of the resource "name.type", if one of the folders holds it.
  std::optional<std::string> pathForResource(std::string_view name, std::string_view type) const;

 private:
  std::vector<std::filesystem::path> folders_;
};

}  // namespace ui
