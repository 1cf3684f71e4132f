// The detail screen's answer for the largest category, and 50 browsers polling detail screens
// over loopback, with the store fed live by the simulated phone.
#include <benchmark/benchmark.h>

#include <algorithm>
#include <boost/asio/connect.hpp>
#include <boost/asio/steady_timer.hpp>
#include <boost/beast/core/flat_buffer.hpp>
#include <boost/beast/core/tcp_stream.hpp>
#include <boost/beast/http/read.hpp>
#include <boost/beast/http/write.hpp>
#include <future>
#include <thread>

#include "app/MainInterface.h"
#include "platform/Log.h"
#include "platform/MainQueue.h"
#include "screens/NorvoViewItems.h"
#include "tarn/sim/Simulator.h"
#include "ui/TableViewController.h"
#include "ui/Timer.h"
#include "ui/web/Address.h"
#include "ui/web/OpenPages.h"
#include "ui/web/PageView.h"
#include "ui/web/Server.h"
#include "ui/web/Site.h"

namespace {

namespace asio = boost::asio;
namespace beast = boost::beast;
namespace http = beast::http;
using Clock = std::chrono::steady_clock;
using namespace std::chrono_literals;

constexpr std::uint64_t kStartEpochMs = 1'700'000'000'000;

// A store fed by the simulated phone, as the session feeds it.
class LiveStore {
 public:
  void advance(std::uint64_t ms) {
    platform::log::Capture quiet;
    for (const tarn::sim::TimedMetric& timed : simulator_.advance(ms))
      validator.metricsDidUpdate({{"kKeyMetricID", std::int64_t{timed.metric.metricId}},
                                  {"kKeyPayload", timed.metric.payload},
                                  {"kKeyProfileID", std::int64_t{0}},
                                  {"kKeyAppID", std::int64_t{2}}});
  }

  store::MetricValidator validator{nullptr};

 private:
  tarn::sim::Simulator simulator_{1, kStartEpochMs};
};

struct Screens {
  explicit Screens(store::MetricValidator& validator) : board(mainInterface(&validator)) {}

  ui::Storyboard board;
  ui::web::OpenPages pages{board, {}};
  ui::web::Site site{pages, {}};
};

std::vector<ui::web::Path> detailPaths() {
  std::vector<ui::web::Path> paths;
  const NorvoViewItems& items = NorvoViewItems::shared();
  for (const std::string& launch : items.launchViewItemNames())
    for (const std::string& item : items.firstLevelViewItems().at(launch))
      paths.push_back({launch, item});
  return paths;
}

std::size_t rowCount(const ui::web::PageView& page) {
  std::size_t rows = 0;
  for (const auto& section : page.sections)
    rows += section.rows.size();
  return rows;
}

// The category with the most rows after ten simulated minutes of driving.
struct Largest {
  Largest() {
    live.advance(10 * 60 * 1000);
    for (const ui::web::Path& candidate : detailPaths()) {
      const std::size_t count = rowCount(describe(*screens.pages.open(candidate, Clock::now())));
      if (count <= rows) continue;
      rows = count;
      path = candidate;
    }
  }

  LiveStore live;
  Screens screens{live.validator};
  ui::web::Path path;
  std::size_t rows = 0;
};

Largest& largest() {
  static Largest instance;
  return instance;
}

ui::web::Request get(const std::string& target) {
  ui::web::Request request(http::verb::get, target, 11);
  request.set(http::field::host, "127.0.0.1");
  return request;
}

void labelLargest(benchmark::State& state) {
  const Largest& shown = largest();
  state.SetLabel(shown.path[0] + " " + shown.path[1] + ", " + std::to_string(shown.rows) + " rows");
}

// The table answers of one reload: what the 5-second timer costs.
void BM_DetailScreenReload(benchmark::State& state) {
  Largest& shown = largest();
  auto& screen = dynamic_cast<ui::TableViewController&>(
      shown.screens.pages.open(shown.path, Clock::now())->navigation().topViewController());
  for (auto _ : state) {
    screen.tableView().reloadData();
    benchmark::DoNotOptimize(screen.tableView().sections().data());
  }
  labelLargest(state);
}
BENCHMARK(BM_DetailScreenReload)->Unit(benchmark::kMicrosecond);

// One poll of the browser: the table as JSON.
void BM_DetailScreenJson(benchmark::State& state) {
  Largest& shown = largest();
  const ui::web::Request request = get("/api/screens" + ui::web::encodePath(shown.path));
  for (auto _ : state)
    benchmark::DoNotOptimize(shown.screens.site.handle(request).body().size());
  labelLargest(state);
}
BENCHMARK(BM_DetailScreenJson)->Unit(benchmark::kMicrosecond);

// Opening the screen's page.
void BM_DetailScreenHtml(benchmark::State& state) {
  Largest& shown = largest();
  const ui::web::Request request = get(ui::web::encodePath(shown.path));
  for (auto _ : state)
    benchmark::DoNotOptimize(shown.screens.site.handle(request).body().size());
  labelLargest(state);
}
BENCHMARK(BM_DetailScreenHtml)->Unit(benchmark::kMicrosecond);

// One browser tab: a kept-alive connection that asks for its screen's JSON once a second.
class PollingClient {
 public:
  PollingClient(asio::io_context& context, asio::ip::tcp::endpoint server,
                const std::string& target, Clock::time_point start, Clock::time_point end,
                std::vector<double>& latenciesMs, std::size_t& failed)
      : stream_(context),
        timer_(context),
        server_(std::move(server)),
        request_(get(target)),
        next_(start),
        end_(end),
        latenciesMs_(latenciesMs),
        failed_(failed) {
    request_.keep_alive(true);
    wait();
  }

 private:
  void wait() {
    if (next_ >= end_) return;
    timer_.expires_at(next_);
    timer_.async_wait([this](beast::error_code) { send(); });
  }

  void send() {
    sentAt_ = Clock::now();
    next_ += 1s;
    if (!connected_) {
      stream_.async_connect(server_, [this](beast::error_code error) {
        if (error) return fail();
        connected_ = true;
        write();
      });
    } else {
      write();
    }
  }

  void write() {
    stream_.expires_after(10s);
    http::async_write(stream_, request_, [this](beast::error_code error, std::size_t) {
      if (error) return fail();
      response_ = {};
      http::async_read(stream_, buffer_, response_, [this](beast::error_code failure, std::size_t) {
        if (failure || response_.result() != http::status::ok || response_.body().empty())
          return fail();
        latenciesMs_.push_back(
            std::chrono::duration<double, std::milli>(Clock::now() - sentAt_).count());
        wait();
      });
    });
  }

  void fail() {
    ++failed_;
    beast::error_code ignored;
    stream_.socket().close(ignored);
    connected_ = false;
    wait();
  }

  beast::tcp_stream stream_;
  asio::steady_timer timer_;
  asio::ip::tcp::endpoint server_;
  ui::web::Request request_;
  beast::flat_buffer buffer_;
  http::response<http::string_body> response_;
  Clock::time_point next_;
  Clock::time_point sentAt_;
  const Clock::time_point end_;
  std::vector<double>& latenciesMs_;
  std::size_t& failed_;
  bool connected_ = false;
};

// Norvo as it runs: the server on the main queue, the store fed every 100 ms, detail screens
// reloading every 5 seconds.
class RunningNorvo {
 public:
  RunningNorvo() {
    std::promise<asio::ip::tcp::endpoint> bound;
    platform::postToMainQueue([this, &bound] {
      screens_.emplace(live_.validator);
      server_.emplace(
          platform::mainQueue(),
          [this](const ui::web::Request& request) { return screens_->site.handle(request); },
          ui::web::Server::Limits{});
      if (server_->listen({asio::ip::make_address("127.0.0.1"), 0}))
        throw std::runtime_error("cannot listen on loopback");
      feed_ = ui::Timer::scheduledTimer(
          100ms, [this] { live_.advance(100); }, true);
      bound.set_value(server_->localEndpoint());
    });
    thread_ = std::thread([] { platform::runMainQueue(); });
    endpoint = bound.get_future().get();
  }

  ~RunningNorvo() {
    std::promise<void> done;
    platform::postToMainQueue([this, &done] {
      feed_.invalidate();
      server_.reset();
      screens_.reset();
      done.set_value();
    });
    done.get_future().wait();
    platform::stopMainQueue();
    thread_.join();
  }

  asio::ip::tcp::endpoint endpoint;

 private:
  LiveStore live_;
  std::optional<Screens> screens_;
  std::optional<ui::web::Server> server_;
  ui::Timer feed_;
  std::thread thread_;
};

double percentile(std::vector<double> values, double fraction) {
  if (values.empty()) return 0;
  std::sort(values.begin(), values.end());
  const auto index = static_cast<std::size_t>(fraction * static_cast<double>(values.size() - 1));
  return values[index];
}

void BM_FiftyBrowsersPollingForAMinute(benchmark::State& state) {
  constexpr int kClients = 50;
  constexpr auto kDuration = 60s;
  std::vector<double> latencies;
  std::size_t failed = 0;
  for (auto _ : state) {
    RunningNorvo norvo;
    asio::io_context clients;
    const std::vector<ui::web::Path> paths = detailPaths();
    const auto start = Clock::now() + 100ms;
    std::vector<std::unique_ptr<PollingClient>> tabs;
    for (int i = 0; i < kClients; ++i) {
      const auto index = static_cast<std::size_t>(i);
      // Spread over the second, as independent browsers would be.
      tabs.push_back(std::make_unique<PollingClient>(
          clients, norvo.endpoint,
          "/api/screens" + ui::web::encodePath(paths[index % paths.size()]), start + index * 20ms,
          start + kDuration, latencies, failed));
    }
    clients.run();
  }
  state.counters["requests"] = static_cast<double>(latencies.size() + failed);
  state.counters["failed"] = static_cast<double>(failed);
  state.counters["p50_ms"] = percentile(latencies, 0.50);
  state.counters["p99_ms"] = percentile(latencies, 0.99);
  state.counters["max_ms"] = percentile(latencies, 1.0);
}
BENCHMARK(BM_FiftyBrowsersPollingForAMinute)
    ->Iterations(1)
    ->UseRealTime()
    ->Unit(benchmark::kSecond);

}  // namespace

BENCHMARK_MAIN();
