#include "ui/TableViewCell.h"

#include <utility>

namespace ui {

TableViewCell::TableViewCell(std::string reuseIdentifier, CellStyle style, CellAccessory accessory)
    : reuseIdentifier_(std::move(reuseIdentifier)), style_(style), accessory_(accessory) {}

Label* TableViewCell::detailTextLabel() {
  return style_ == CellStyle::RightDetail ? &detailTextLabel_ : nullptr;
}

const Label* TableViewCell::detailTextLabel() const {
  return style_ == CellStyle::RightDetail ? &detailTextLabel_ : nullptr;
}

}  // namespace ui
