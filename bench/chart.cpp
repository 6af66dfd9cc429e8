// SPDX-License-Identifier: Apache-2.0
#include "chart.h"

#include <ostream>

namespace bench {

namespace {

bool is_growth(const Result& result) {
    return result.test.family.rfind("growth", 0) == 0;
}

Figures best_figures(const Result& result) {
    return figures_of(result, sets_of(result).back());
}

// Multiples of the limit: ours, the wrapper, the best peer.
int write_cases(std::ostream& out, const std::vector<Result>& results) {
    int rows = 0;
    out << "$cases << END\n";
    for (const Result& result : results) {
        if (is_growth(result)) continue;
        const Figures figures = best_figures(result);
        const double limit = figures.limit.median;
        const auto multiple = [&](const std::optional<Quartiles>& seconds) {
            return seconds ? std::to_string(seconds->median / limit) : "NaN";
        };
        out << '"' << result.test.family << ' ' << result.test.name << "\" "
            << multiple(figures.single) << ' ' << multiple(figures.wrapper) << ' '
            << figures.best_peer_seconds / limit << '\n';
        ++rows;
    }
    out << "END\n";
    return rows;
}

// Megapixels of the source, and nanoseconds for each of its pixels: ours, the wrapper, the limit,
// the best peer. Returns whether there were any.
bool write_growth(std::ostream& out, const std::vector<Result>& results,
                  const std::string& layout) {
    bool any = false;
    for (const Result& result : results) {
        if (result.test.family != "growth " + layout) continue;
        const Figures figures = best_figures(result);
        const Size src = result.test.job.src;
        const double pixels = static_cast<double>(src.width) * src.height;
        const double scale = 1e9 / pixels;
        out << pixels / 1e6 << ' ' << figures.single->median * scale << ' '
            << figures.wrapper->median * scale << ' ' << figures.limit.median * scale << ' '
            << figures.best_peer_seconds * scale << '\n';
        any = true;
    }
    out << "\n\n";
    return any;
}

}  // namespace

void write_chart_data(std::ostream& out, const std::vector<Result>& results) {
    const int cases = write_cases(out, results);
    out << "$growth << END\n";
    const bool nv21 = write_growth(out, results, "NV21");
    const bool rgba = write_growth(out, results, "RGBA");
    out << "END\ncases = " << cases << "\ngrowth_layouts = '" << (nv21 && rgba ? "NV21 RGBA" : "")
        << "'\n";
}

}  // namespace bench
