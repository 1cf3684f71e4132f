// Delivery of metrics from the in-process baseband manager service to the TarnWrapper delegate on
// the main queue: the whole path that each metric takes in the app, system log line included.
#include "DeliveryPipeline.h"
#include "tarn/transport/InProcess.h"

namespace {

using delivery::BM_DeliveryLatencyAt1000PerSecond;
using delivery::BM_DeliveryThroughput;

struct InProcessPath {
  delivery::Pipeline pipeline{[](std::shared_ptr<tarn::service::Core> core) {
    return std::make_shared<tarn::transport::InProcess>(std::move(core));
  }};
};

}  // namespace

BENCHMARK_TEMPLATE(BM_DeliveryThroughput, InProcessPath)
    ->Arg(10000)
    ->UseRealTime()
    ->Unit(benchmark::kMillisecond);
BENCHMARK_TEMPLATE(BM_DeliveryLatencyAt1000PerSecond, InProcessPath)
    ->Arg(3000)
    ->Iterations(1)
    ->UseRealTime()
    ->Unit(benchmark::kMillisecond);

BENCHMARK_MAIN();
