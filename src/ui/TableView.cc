#include "ui/TableView.h"

#include <stdexcept>
#include <utility>

namespace ui {

std::optional<std::string> TableViewDataSource::titleForHeader(TableView&, std::size_t) {
  return std::nullopt;
}

void TableView::registerPrototype(TableViewCell prototype) {
  std::string identifier = prototype.reuseIdentifier();
  prototypes_.insert_or_assign(std::move(identifier), std::move(prototype));
}

std::shared_ptr<TableViewCell> TableView::dequeueReusableCell(std::string_view identifier) {
  const auto prototype = prototypes_.find(identifier);
  if (prototype == prototypes_.end())
    throw std::out_of_range("no prototype cell is registered as \"" + std::string(identifier) +
                            "\"");
  const auto spare = spareCells_.find(identifier);
  if (spare == spareCells_.end() || spare->second.empty())
    return std::make_shared<TableViewCell>(prototype->second);
  std::shared_ptr<TableViewCell> cell = std::move(spare->second.back());
  spare->second.pop_back();
  *cell = prototype->second;
  return cell;
}

void TableView::reloadData() {
  for (Section& section : std::exchange(sections_, {}))
    for (std::shared_ptr<TableViewCell>& cell : section.cells) {
      Cells& spare = spareCells_[cell->reuseIdentifier()];
      spare.push_back(std::move(cell));
    }
  if (dataSource_ == nullptr) return;

  std::vector<Section> sections(dataSource_->numberOfSections(*this));
  for (std::size_t s = 0; s < sections.size(); ++s) {
    sections[s].header = dataSource_->titleForHeader(*this, s);
    const std::size_t rows = dataSource_->numberOfRows(*this, s);
    sections[s].cells.reserve(rows);
    for (std::size_t row = 0; row < rows; ++row) {
      std::shared_ptr<TableViewCell> cell = dataSource_->cellForRow(*this, {s, row});
      if (!cell) throw std::logic_error("a table screen answered no cell");
      sections[s].cells.push_back(std::move(cell));
    }
  }
  sections_ = std::move(sections);
  ++reloadCount_;
}

std::shared_ptr<TableViewCell> TableView::cellForRow(IndexPath indexPath) const {
  if (indexPath.section >= sections_.size()) return nullptr;
  const Cells& cells = sections_[indexPath.section].cells;
  return indexPath.row < cells.size() ? cells[indexPath.row] : nullptr;
}

}  // namespace ui
