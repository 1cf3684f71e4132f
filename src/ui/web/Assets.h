#pragma once

#include <string_view>

namespace ui::web {

// A file the pages load: the style sheet, the script, the icon. Built into the program.
struct Asset {
  std::string_view name;
  std::string_view contentType;
  std::string_view etag;  // changes whenever the content does
  std::string_view content;
};

// Null for a name that is not one of the assets.
const Asset* findAsset(std::string_view name);

}  // namespace ui::web
