#include "export/PcapngExport.h"

#include <limits>

#include "export/MetricPacket.h"
#include "export/PcapngWriter.h"

namespace exporting {

namespace {

constexpr std::string_view kApplication = "Norvo";
constexpr std::string_view kInterfaceName = "norvo";

class PcapngExport final : public MetricExport {
 public:
  PcapngExport(std::unique_ptr<OutputFile> output, const ExportOptions& options)
      : output_(std::move(output)), live_(options.live) {
    pcapng::appendSectionHeader(output_->pending(), kApplication);
    pcapng::appendInterfaceDescription(output_->pending(), kUpperPduLinkType, kInterfaceName);
    // A live reader learns the link type before the first metric comes.
    if (live_) output_->commit(true);
  }

  bool write(const ExportedMetric& metric) override {
    writeMetricPacketHeader(header_, metric.metricID, metric.device);
    const std::string_view parts[] = {
        header_, {reinterpret_cast<const char*>(metric.payload->data()), metric.payload->size()}};
    constexpr auto kLatestMs = std::numeric_limits<std::uint64_t>::max() / 1000;
    const auto milliseconds = std::min(static_cast<std::uint64_t>(metric.timeMs), kLatestMs);
    pcapng::appendEnhancedPacket(output_->pending(), milliseconds * 1000, parts);
    return output_->commit(live_);
  }

  bool finish(std::string& error) override { return output_->close(error); }

 private:
  std::unique_ptr<OutputFile> output_;
  const bool live_;
  std::string header_;
};

}  // namespace

std::unique_ptr<MetricExport> openPcapngExport(std::string_view target,
                                               const ExportOptions& options, std::string& error) {
  std::unique_ptr<OutputFile> output = OutputFile::open(target, error);
  if (!output) return nullptr;
  return std::make_unique<PcapngExport>(std::move(output), options);
}

}  // namespace exporting
