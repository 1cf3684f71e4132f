#pragma once

#include <chrono>
#include <cstddef>
#include <map>
#include <memory>
#include <string>

#include "ui/NavigationController.h"
#include "ui/Storyboard.h"
#include "ui/Timer.h"
#include "ui/Window.h"
#include "ui/web/Address.h"

namespace ui::web {

// One open address: a window of its own whose navigation stack was built by tapping, from the
// root screen, the rows the address names. Tabs at the same address share it.
class Page {
 public:
  Page(Path path, std::unique_ptr<NavigationController> navigation);

  const Path& path() const { return path_; }
  const std::string& address() const { return address_; }
  NavigationController& navigation() const { return *navigation_; }

 private:
  Path path_;
  std::string address_;
  NavigationController* navigation_;
  Window window_;
};

// The addresses the browser has open. A page that no one has asked for within the idle limit is
// closed, and its screens with it, so a detail screen stops refreshing once its tabs are gone.
class OpenPages {
 public:
  using Clock = std::chrono::steady_clock;

  struct Limits {
    std::size_t maxOpen = 64;  // past this, the page asked for least recently closes
    Clock::duration idle = std::chrono::seconds(15);
  };

  // Checks for idle pages on the main queue while it runs.
  OpenPages(const Storyboard& storyboard, Limits limits);
  OpenPages(const OpenPages&) = delete;
  OpenPages& operator=(const OpenPages&) = delete;

  // The page at `path`, opened if needed, and marked as asked for at `now`. Null when the
  // texts do not name rows that lead, one after the other, from the root screen to a screen.
  Page* open(const Path& path, Clock::time_point now);

  void closeIdle(Clock::time_point now);
  bool isOpen(const Path& path) const { return pages_.contains(path); }
  std::size_t size() const { return pages_.size(); }

 private:
  struct Entry {
    std::unique_ptr<Page> page;
    Clock::time_point lastAsked;
  };

  std::unique_ptr<Page> build(const Path& path) const;
  void closeLeastRecent();

  const Storyboard& storyboard_;
  const Limits limits_;
  std::map<Path, Entry> pages_;
  Timer idleCheck_;
};

}  // namespace ui::web
