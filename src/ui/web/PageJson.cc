#include "ui/web/PageJson.h"

#include "platform/Json.h"
#include "platform/Value.h"

namespace ui::web {

namespace {

platform::Value orNull(const std::optional<std::string>& text) {
  return text ? platform::Value(*text) : platform::Value();
}

}  // namespace

std::string renderJson(const PageView& page) {
  platform::List sections;
  sections.reserve(page.sections.size());
  for (const SectionView& section : page.sections) {
    platform::List rows;
    rows.reserve(section.rows.size());
    for (const RowView& row : section.rows) {
      platform::Dictionary entry{{"text", orNull(row.text)}, {"detail", orNull(row.detail)}};
      if (row.href) entry.append("href", *row.href);
      rows.emplace_back(std::move(entry));
    }
    sections.emplace_back(
        platform::Dictionary{{"header", orNull(section.header)}, {"rows", std::move(rows)}});
  }
  return platform::toJson(
      platform::Dictionary{{"title", page.title}, {"sections", std::move(sections)}});
}

}  // namespace ui::web
