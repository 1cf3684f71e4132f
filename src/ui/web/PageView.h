#pragma once

#include <optional>
#include <string>
#include <vector>

#include "ui/web/OpenPages.h"

// What a page shows, read off its top screen's table as of the table's latest reload; the HTML
// and the JSON are both written from it.
namespace ui::web {

struct RowView {
  std::optional<std::string> text;
  std::optional<std::string> detail;
  // The address a tap on the row opens; only rows that show they lead somewhere have one.
  std::optional<std::string> href;
};

struct SectionView {
  std::optional<std::string> header;
  std::vector<RowView> rows;
};

struct BackLink {
  std::string title;
  std::string href;
};

// A link of the top bar to a page beside the screens, such as the dashboard.
struct BarLink {
  std::string title;
  std::string href;
};

struct PageView {
  std::string title;
  std::string address;
  std::optional<BackLink> back;  // absent on the root screen
  std::vector<SectionView> sections;
  std::vector<BarLink> barLinks;
};

PageView describe(const Page& page);

}  // namespace ui::web
