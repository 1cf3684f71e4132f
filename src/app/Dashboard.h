#pragma once

#include "series/SeriesStore.h"
#include "store/MetricValidator.h"
#include "ui/Application.h"

namespace app {

// The dashboard beside the screens: `series` is fed from `intake` after each metric's
// conversion, and the pages get GET /dashboard (linked from the launch screen),
// GET /api/series and GET /api/dashboard.
void addDashboard(ui::DisplayOptions& display, store::MetricValidator& intake,
                  series::SeriesStore& series);

}  // namespace app
