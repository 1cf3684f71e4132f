#pragma once

#include <string>

#include "ui/web/PageView.h"

namespace ui::web {

// {"title": ..., "sections": [{"header": text or null, "rows": [{"text": text or null,
// "detail": text or null}, ...]}, ...]}; a row that leads to another screen also has "href".
std::string renderJson(const PageView& page);

}  // namespace ui::web
