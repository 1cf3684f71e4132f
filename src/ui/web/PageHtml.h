#pragma once

#include <string>
#include <string_view>

#include "ui/web/PageView.h"

namespace ui::web {

// Text made safe for HTML content and quoted attribute values.
std::string escapeHtml(std::string_view text);

// A whole document: the top bar with the title and a back link, and the table. Its script keeps
// the table up to date from the page's JSON.
std::string renderHtml(const PageView& page);

// A document with a title, one line of text, and a back link home labelled `homeTitle`.
std::string renderMessagePage(std::string_view homeTitle, std::string_view title,
                              std::string_view message);

}  // namespace ui::web
