#pragma once

#include <cstddef>
#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "ui/IndexPath.h"
#include "ui/TableViewCell.h"

namespace ui {

class TableView;

// What a table view asks of its screen each time it loads its rows.
class TableViewDataSource {
 public:
  virtual ~TableViewDataSource() = default;

  virtual std::size_t numberOfSections(TableView& tableView) = 0;
  virtual std::size_t numberOfRows(TableView& tableView, std::size_t section) = 0;
  // No header unless a screen gives one.
  virtual std::optional<std::string> titleForHeader(TableView& tableView, std::size_t section);
  virtual std::shared_ptr<TableViewCell> cellForRow(TableView& tableView, IndexPath indexPath) = 0;
};

// A list of sections of rows. It keeps what its data source answered at the latest reload, and
// hands the cells of that reload out again, reset, to the next one.
class TableView {
 public:
  struct Section {
    std::optional<std::string> header;
    std::vector<std::shared_ptr<TableViewCell>> cells;
  };

  // Cells dequeued under the prototype's reuse identifier start as copies of it.
  void registerPrototype(TableViewCell prototype);

  // A cell like the prototype of `identifier`: a spare one from the previous reload if there is
  // one, else a new one. Throws std::out_of_range when no prototype has that identifier.
  std::shared_ptr<TableViewCell> dequeueReusableCell(std::string_view identifier);

  // Not owned; the table asks nothing while it has none.
  void setDataSource(TableViewDataSource* dataSource) { dataSource_ = dataSource; }

  // Asks the data source for every section, header and cell again. If the data source throws,
  // the table is left empty and the exception passes on.
  void reloadData();

  const std::vector<Section>& sections() const { return sections_; }
  // The cell shown at `indexPath`, or null.
  std::shared_ptr<TableViewCell> cellForRow(IndexPath indexPath) const;
  // How often the table has reloaded; tells a display whether there is anything new to show.
  std::size_t reloadCount() const { return reloadCount_; }

 private:
  using Cells = std::vector<std::shared_ptr<TableViewCell>>;

  TableViewDataSource* dataSource_ = nullptr;
  std::map<std::string, TableViewCell, std::less<>> prototypes_;
  std::map<std::string, Cells, std::less<>> spareCells_;
  std::vector<Section> sections_;
  std::size_t reloadCount_ = 0;
};

}  // namespace ui
