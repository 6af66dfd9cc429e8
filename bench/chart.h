// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <iosfwd>

#include "report.h"

namespace bench {

// Writes the results as gnuplot definitions, for chart.gp.
void write_chart_data(std::ostream& out, const std::vector<Result>& results);

}  // namespace bench
