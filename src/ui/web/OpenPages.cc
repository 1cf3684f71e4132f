#include "ui/web/OpenPages.h"

#include <algorithm>
#include <optional>
#include <utility>

#include "ui/TableViewController.h"

namespace ui::web {

namespace {

// The first row, in table order, that shows `text`.
std::optional<IndexPath> findRow(const TableView& table, const std::string& text) {
  const auto& sections = table.sections();
  for (std::size_t s = 0; s < sections.size(); ++s)
    for (std::size_t row = 0; row < sections[s].cells.size(); ++row)
      if (sections[s].cells[row]->textLabel()->text == text) return IndexPath{s, row};
  return std::nullopt;
}

}  // namespace

Page::Page(Path path, std::unique_ptr<NavigationController> navigation)
    : path_(std::move(path)), address_(encodePath(path_)), navigation_(navigation.get()) {
  window_.setRootViewController(std::move(navigation));
  window_.makeKeyAndVisible();
}

OpenPages::OpenPages(const Storyboard& storyboard, Limits limits)
    : storyboard_(storyboard),
      limits_(limits),
      idleCheck_(Timer::scheduledTimer(
          limits.idle / 3, [this] { closeIdle(Clock::now()); }, true)) {}

Page* OpenPages::open(const Path& path, Clock::time_point now) {
  auto found = pages_.find(path);
  if (found == pages_.end()) {
    std::unique_ptr<Page> page = build(path);
    if (!page) return nullptr;
    if (pages_.size() >= limits_.maxOpen) closeLeastRecent();
    found = pages_.emplace(path, Entry{std::move(page), now}).first;
  }
  found->second.lastAsked = now;
  return found->second.page.get();
}

void OpenPages::closeIdle(Clock::time_point now) {
  std::erase_if(pages_,
                [&](const auto& entry) { return now - entry.second.lastAsked > limits_.idle; });
}

std::unique_ptr<Page> OpenPages::build(const Path& path) const {
  auto page = std::make_unique<Page>(
      path, std::make_unique<NavigationController>(
                storyboard_.instantiateViewController(storyboard_.rootScene())));
  NavigationController& navigation = page->navigation();
  for (const std::string& text : path) {
    const auto* table = dynamic_cast<const TableViewController*>(&navigation.topViewController());
    if (table == nullptr) return nullptr;
    const std::optional<IndexPath> row = findRow(table->tableView(), text);
    if (!row || !storyboard_.selectRow(navigation, *row)) return nullptr;
  }
  return page;
}

void OpenPages::closeLeastRecent() {
  const auto oldest = std::min_element(
      pages_.begin(), pages_.end(),
      [](const auto& a, const auto& b) { return a.second.lastAsked < b.second.lastAsked; });
  if (oldest != pages_.end()) pages_.erase(oldest);
}

}  // namespace ui::web
