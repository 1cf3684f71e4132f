#include "app/Dashboard.h"

#include "dashboard/SeriesApi.h"
#include "dashboard/ServingCell.h"
#include "platform/Json.h"

namespace app {

void addDashboard(ui::DisplayOptions& display, store::MetricValidator& intake,
                  series::SeriesStore& series) {
  intake.addStoreObserver(
      [&series](store::DisplayDictionary replaced, const store::MetricValidator& store) {
        series.storeDidUpdate(replaced, store);
      });
  display.queries.emplace("series", [&series](const ui::web::QueryParameters& parameters) {
    return dashboard::answerSeries(series, parameters);
  });
  display.readings.emplace("dashboard", [&intake, &series] {
    return platform::toJson(dashboard::dashboardCard(intake, series));
  });
  display.documents.push_back({"/dashboard", "dashboard.html", "Dashboard"});
}

}  // namespace app
