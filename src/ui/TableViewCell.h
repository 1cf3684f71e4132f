#pragma once

#include <optional>
#include <string>

namespace ui {

// A line of text in a cell; absent text shows nothing.
struct Label {
  std::optional<std::string> text;

  bool operator==(const Label&) const = default;
};

enum class CellStyle {
  Basic,        // a text label only
  RightDetail,  // a text label, and a detail text label beside it (under it where space is short)
};

enum class CellAccessory {
  None,
  DisclosureIndicator,  // the row leads to another screen
};

// One row's view. Cells are made from a prototype registered with a table view under a reuse
// identifier, and handed out again for other rows after a reload.
class TableViewCell {
 public:
  TableViewCell(std::string reuseIdentifier, CellStyle style,
                CellAccessory accessory = CellAccessory::None);

  const std::string& reuseIdentifier() const { return reuseIdentifier_; }
  CellStyle style() const { return style_; }
  CellAccessory accessoryType() const { return accessory_; }

  Label* textLabel() { return &textLabel_; }
  const Label* textLabel() const { return &textLabel_; }
  // Null when the cell's style has no detail text label.
  Label* detailTextLabel();
  const Label* detailTextLabel() const;

 private:
  std::string reuseIdentifier_;
  CellStyle style_;
  CellAccessory accessory_;
  Label textLabel_;
  Label detailTextLabel_;
};

}  // namespace ui
