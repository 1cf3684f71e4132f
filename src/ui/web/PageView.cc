#include "ui/web/PageView.h"

#include "ui/TableViewController.h"

namespace ui::web {

namespace {

std::optional<std::string> textOf(const Label* label) {
  return label != nullptr ? label->text : std::nullopt;
}

RowView describe(const TableViewCell& cell, const std::string& address) {
  RowView row{cell.textLabel()->text, textOf(cell.detailTextLabel()), std::nullopt};
  if (cell.accessoryType() == CellAccessory::DisclosureIndicator && row.text)
    row.href = appendToAddress(address, *row.text);
  return row;
}

}  // namespace

PageView describe(const Page& page) {
  const std::vector<ViewController*> stack = page.navigation().viewControllers();
  const ViewController& top = *stack.back();

  PageView view{top.title().value_or(""), page.address(), std::nullopt, {}, {}};
  if (stack.size() > 1) {
    Path parent = page.path();
    parent.pop_back();
    view.back = BackLink{stack[stack.size() - 2]->title().value_or("Back"), encodePath(parent)};
  }

  const auto* table = dynamic_cast<const TableViewController*>(&top);
  if (table == nullptr) return view;
  for (const TableView::Section& section : table->tableView().sections()) {
    SectionView& described = view.sections.emplace_back(SectionView{section.header, {}});
    described.rows.reserve(section.cells.size());
    for (const auto& cell : section.cells)
      described.rows.push_back(describe(*cell, view.address));
  }
  return view;
}

}  // namespace ui::web
