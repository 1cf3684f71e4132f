#pragma once

#include <map>
#include <string>
#include <vector>

// The browser's whole vocabulary: the launch screen's rows, and under each the rows of its
// first-level screen. The names are also what the detail screen dispatches on, so each must be
// exactly the text that screen compares against.
class NorvoViewItems {
 public:
  NorvoViewItems();

  // Built once, on first use from any thread.
  static const NorvoViewItems& shared();

  const std::vector<std::string>& launchViewItemNames() const { return launchViewItemNames_; }
  // One entry per launch item name, each in display order.
  const std::map<std::string, std::vector<std::string>>& firstLevelViewItems() const {
    return firstLevelViewItems_;
  }

  bool operator==(const NorvoViewItems&) const = default;

 private:
  std::vector<std::string> launchViewItemNames_;
  std::map<std::string, std::vector<std::string>> firstLevelViewItems_;
};
