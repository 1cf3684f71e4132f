#pragma once

#include "series/SeriesStore.h"
#include "ui/web/Site.h"

namespace dashboard {

// GET /api/series: every series with its unit, graph, sample count and latest sample, and the
// series store's time now:
//   {"now": MS, "series": [{"name": "lte.rsrp", "label": "LTE RSRP", "unit": "dBm",
//                           "graph": "level", "count": 3600, "latest": [MS, -95.0] or null}]}
// GET /api/series?name=lte.rsrp&since=MS: the samples at or after MS (all without since) as
// columns a chart takes as they are:
//   {"name": "lte.rsrp", "unit": "dBm", "times": [MS, ...], "values": [-95.0, ...]}
// Refused with 400 when since is not a whole number of milliseconds or lies in the future, or
// comes without a name; 404 for a name that is no series.
ui::web::Site::QueryAnswer answerSeries(const series::SeriesStore& store,
                                        const ui::web::QueryParameters& parameters);

}  // namespace dashboard
