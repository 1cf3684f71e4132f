#include "export/JsonLinesExport.h"

#include "export/OutputFile.h"
#include "export/UtcTime.h"
#include "platform/Base64.h"
#include "platform/Json.h"
#include "platform/NumberText.h"

namespace exporting {

namespace {

class JsonLinesExport final : public MetricExport {
 public:
  JsonLinesExport(std::unique_ptr<OutputFile> output, const ExportOptions& options)
      : output_(std::move(output)), options_(options) {}

  bool write(const ExportedMetric& metric) override {
    appendJsonLine(output_->pending(), metric, options_.raw);
    output_->pending() += '\n';
    return output_->commit(options_.live);
  }

  bool finish(std::string& error) override { return output_->close(error); }

 private:
  std::unique_ptr<OutputFile> output_;
  const ExportOptions options_;
};

}  // namespace

void appendJsonLine(std::string& out, const ExportedMetric& metric, bool withPayload) {
  // The envelope's keys and most of its values need no escaping; only text from the log does.
  out += "{\"time\":\"";
  out += utcTimeText(metric.timeMs);
  out += '"';
  if (metric.deliveryMs) {
    out += ",\"t_ms\":";
    platform::appendDecimal(out, *metric.deliveryMs);
  }
  out += ",\"metric_id\":";
  platform::appendDecimal(out, metric.metricID);
  const messages::RecordClass* record = metric.known ? metric.known->record : nullptr;
  out += ",\"record\":";
  if (record != nullptr) {
    out += '"';
    out += record->name;
    out += '"';
  } else {
    out += "null";
  }
  if (!metric.device.empty()) {
    out += ",\"device\":";
    platform::appendJson(out, std::string(metric.device));
  }
  if (record != nullptr) {
    out += ",\"fields\":";
    if (const std::optional<platform::Dictionary> fields = decodeRecord(*metric.payload, *record)) {
      platform::appendJson(out, *fields);
    } else {
      out += "null,\"error\":\"the payload does not decode as ";
      out += record->name;
      out += '"';
    }
  }
  if (withPayload) {
    out += ",\"payload\":\"";
    out += platform::base64Encode(*metric.payload);
    out += '"';
  }
  out += '}';
}

std::unique_ptr<MetricExport> openJsonLinesExport(std::string_view target,
                                                  const ExportOptions& options,
                                                  std::string& error) {
  std::unique_ptr<OutputFile> output = OutputFile::open(target, error);
  if (!output) return nullptr;
  return std::make_unique<JsonLinesExport>(std::move(output), options);
}

}  // namespace exporting
