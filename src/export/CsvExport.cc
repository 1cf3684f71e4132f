#include "export/CsvExport.h"

#include <filesystem>
#include <map>
#include <vector>

#include "export/CsvText.h"
#include "export/OutputFile.h"
#include "export/UtcTime.h"
#include "messages/RecordFields.h"

namespace exporting {

namespace {

constexpr std::string_view kLayoutVersion = "1";
constexpr std::string_view kMetricColumns[] = {"time", "t_ms", "metric_id", "device"};
constexpr std::string_view kUndecodedName = "undecoded";
// Records nest a few levels at most; a schema that looped would stop here.
constexpr int kDeepestNesting = 8;

using messages::RecordField;

// A value's path inside a record's dictionary: the keys of nested records, then the field's.
using Path = std::vector<std::string_view>;

const platform::Value* valueAt(const platform::Dictionary& dictionary, const Path& path) {
  const platform::Dictionary* level = &dictionary;
  for (std::size_t i = 0; i + 1 < path.size(); ++i) {
    const platform::Value* nested = level->find(path[i]);
    if (nested == nullptr || !nested->isDictionary()) return nullptr;
    level = nested->asDictionary();
  }
  return level->find(path.back());
}

std::string joined(const Path& path, std::string_view separator) {
  std::string text;
  for (const std::string_view key : path)
    text += (text.empty() ? "" : std::string(separator)) + std::string(key);
  return text;
}

// One CSV file: the rows of a record kind, or of the elements of one of its lists.
class Table {
 public:
  Table(std::string fileName, std::string_view recordClass, bool isList)
      : fileName_(std::move(fileName)), isList_(isList) {
    addColumns(recordClass, {}, 0);
  }

  // Writes the row of `record` and those of its lists' elements; answers the row's number.
  std::size_t write(const std::filesystem::path& folder, const ExportedMetric& metric,
                    const platform::Dictionary& record, std::size_t parentRow, std::size_t index,
                    std::string& error) {
    if (!open(folder, error)) return 0;
    const std::size_t row = ++rows_;
    line_.clear();
    line_ += kLayoutVersion;
    line_ += ',' + std::to_string(row);
    if (isList_) line_ += ',' + std::to_string(parentRow) + ',' + std::to_string(index);
    appendMetricCells(line_, metric);
    for (const Path& column : columns_) {
      line_ += ',';
      if (const platform::Value* value = valueAt(record, column))
        csv::appendField(line_, csv::cellText(*value));
    }
    line_ += "\r\n";
    output_->append(line_);
    for (List& list : lists_) {
      const platform::Value* elements = valueAt(record, list.path);
      if (elements == nullptr || !elements->isList()) continue;
      std::size_t elementIndex = 0;
      for (const platform::Value& element : *elements->asList()) {
        if (const platform::Dictionary* fields = element.asDictionary())
          list.table->write(folder, metric, *fields, row, elementIndex, error);
        ++elementIndex;
      }
    }
    return row;
  }

  // Closes this file and those of the lists; false, with `error` saying why, when output failed.
  bool close(std::string& error) {
    bool closed = !output_ || output_->close(error);
    for (List& list : lists_)
      closed = list.table->close(error) && closed;
    return closed;
  }

  static void appendMetricCells(std::string& line, const ExportedMetric& metric) {
    line += ',' + utcTimeText(metric.timeMs);
    line += ',';
    if (metric.deliveryMs) line += std::to_string(*metric.deliveryMs);
    line += ',' + std::to_string(metric.metricID) + ',';
    csv::appendField(line, metric.device);
  }

 private:
  struct List {
    Path path;
    std::unique_ptr<Table> table;
  };

  void addColumns(std::string_view recordClass, const Path& prefix, int depth) {
    if (depth > kDeepestNesting) return;
    for (const RecordField& field : messages::recordFields(recordClass)) {
      Path path = prefix;
      path.push_back(field.key);
      switch (field.shape) {
        case RecordField::Shape::Value:
        case RecordField::Shape::NumberList:
          columns_.push_back(std::move(path));
          break;
        case RecordField::Shape::Record:
          addColumns(field.recordClass, path, depth + 1);
          break;
        case RecordField::Shape::RecordList: {
          const std::string stem = fileName_.substr(0, fileName_.size() - 4);
          auto table = std::make_unique<Table>(stem + "." + joined(path, ".") + ".csv",
                                               field.recordClass, true);
          lists_.push_back({std::move(path), std::move(table)});
          break;
        }
      }
    }
  }

  bool open(const std::filesystem::path& folder, std::string& error) {
    if (output_) return output_->commit();
    output_ = OutputFile::open((folder / fileName_).string(), error);
    if (!output_) return false;
    std::string header = "layout,row";
    if (isList_) header += ",parent_row,position";
    for (const std::string_view column : kMetricColumns)
      header += "," + std::string(column);
    for (const Path& column : columns_) {
      header += ',';
      csv::appendField(header, joined(column, "."));
    }
    header += "\r\n";
    output_->append(header);
    return true;
  }

  const std::string fileName_;
  const bool isList_;
  std::vector<Path> columns_;
  std::vector<List> lists_;
  std::unique_ptr<OutputFile> output_;
  std::size_t rows_ = 0;
  std::string line_;
};

class CsvExport final : public MetricExport {
 public:
  explicit CsvExport(std::filesystem::path folder) : folder_(std::move(folder)) {}

  bool write(const ExportedMetric& metric) override {
    const messages::RecordClass* record = metric.known ? metric.known->record : nullptr;
    if (record == nullptr) return writeUndecoded(metric, "no record carries this metric");
    const std::optional<platform::Dictionary> fields = decodeRecord(*metric.payload, *record);
    if (!fields)
      return writeUndecoded(metric, "the payload does not decode as " + std::string(record->name));
    auto& table = tables_[record->name];
    if (!table)
      table = std::make_unique<Table>(std::string(record->name) + ".csv", record->name, false);
    return table->write(folder_, metric, *fields, 0, 0, error_) != 0 && error_.empty();
  }

  bool finish(std::string& error) override {
    bool closed = error_.empty();
    error = error_;
    for (auto& [name, table] : tables_)
      closed = table->close(error) && closed;
    return (!undecoded_ || undecoded_->close(error)) && closed;
  }

 private:
  bool writeUndecoded(const ExportedMetric& metric, const std::string& reason) {
    if (!undecoded_) {
      undecoded_ =
          OutputFile::open((folder_ / (std::string(kUndecodedName) + ".csv")).string(), error_);
      if (!undecoded_) return false;
      undecoded_->append("layout,row,time,t_ms,metric_id,device,reason,payload\r\n");
    }
    std::string line(kLayoutVersion);
    line += ',' + std::to_string(++undecodedRows_);
    Table::appendMetricCells(line, metric);
    line += ',';
    csv::appendField(line, reason);
    line += ',' + csv::cellText(*metric.payload) + "\r\n";
    undecoded_->append(line);
    return undecoded_->commit();
  }

  const std::filesystem::path folder_;
  std::map<std::string_view, std::unique_ptr<Table>> tables_;
  std::unique_ptr<OutputFile> undecoded_;
  std::size_t undecodedRows_ = 0;
  std::string error_;
};

}  // namespace

std::unique_ptr<MetricExport> openCsvExport(std::string_view target, const ExportOptions&,
                                            std::string& error) {
  const std::filesystem::path folder(target);
  std::error_code failure;
  std::filesystem::create_directories(folder, failure);
  if (failure || !std::filesystem::is_directory(folder)) {
    error = "cannot make the folder " + folder.string() +
            (failure ? " (" + failure.message() + ")" : std::string(" (a file is in the way)"));
    return nullptr;
  }
  return std::make_unique<CsvExport>(folder);
}

}  // namespace exporting
