#include "player/Drive.h"

#include <algorithm>
#include <fstream>
#include <ostream>
#include <stdexcept>

#include "tarn/log/MetricLog.h"

namespace player {

namespace {

// What makes a record unfit to replay, or nothing.
std::string unfit(const platform::Dictionary& record) {
  const platform::Value* id = record.find("kKeyMetricID");
  if (id == nullptr || !id->asInteger()) return "no integer \"kKeyMetricID\"";
  const platform::Value* payload = record.find("kKeyPayload");
  if (payload == nullptr || !payload->isBytes()) return "no \"kKeyPayload\"";
  return {};
}

}  // namespace

Drive readDrive(const std::string& path, std::ostream& errors) {
  std::ifstream file(path, std::ios::binary);
  if (!file) throw std::runtime_error("cannot read " + path);
  return readDrive(file, path, errors);
}

Drive readDrive(std::istream& log, const std::string& name, std::ostream& errors) {
  Drive drive;
  tarn::log::MetricLogReader reader(log);
  std::int64_t lastMs = 0;
  while (std::optional<tarn::log::MetricLogReader::Line> line = reader.next()) {
    std::string error = line->parsed.error;
    if (line->parsed.entry) error = unfit(line->parsed.entry->record);
    if (!error.empty()) {
      errors << name << ':' << line->number << ": " << error << "; line skipped\n";
      continue;
    }
    lastMs = std::max(lastMs, line->parsed.entry->deliveryMs.value_or(lastMs));
    drive.metrics.push_back({lastMs, std::move(line->parsed.entry->record)});
  }
  if (reader.failed()) throw std::runtime_error("cannot read " + name + " to its end");
  return drive;
}

}  // namespace player
