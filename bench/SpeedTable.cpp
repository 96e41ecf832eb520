#include "bench/SpeedTable.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <cstdio>
#include <exception>

namespace ventras {
namespace {

// Figures from fractions of a millisecond to millions a second, each with the digits that mean something.
std::string text(double figure, std::string_view unit) {
    std::array<char, 64> buffer{};
    const int digits = figure < 10 && figure != std::floor(figure) ? 2 : figure < 100 ? 1 : 0;
    std::snprintf(buffer.data(), buffer.size(), "%.*f", digits, figure);
    return std::string(buffer.data()).append(unit.empty() ? "" : " ").append(unit);
}

}  // namespace

void SpeedTable::atMost(std::string_view what, double measured, double limit, std::string_view unit) {
    rows_.push_back({std::string(what), text(measured, unit), "<= " + text(limit, unit), measured <= limit});
}

void SpeedTable::atLeast(std::string_view what, double measured, double limit, std::string_view unit) {
    rows_.push_back({std::string(what), text(measured, unit), ">= " + text(limit, unit), measured >= limit});
}

void SpeedTable::note(std::string_view what, double measured, std::string_view unit) {
    rows_.push_back({std::string(what), text(measured, unit), "", true});
}

bool SpeedTable::print() const {
    std::printf("%-66s %14s %14s\n", "", "measured", "target");
    for (const auto& [what, measured, target, reached] : rows_) {
        const char* verdict = target.empty() ? "" : reached ? "pass" : "MISSED";
        std::printf("%-66s %14s %14s  %s\n", what.c_str(), measured.c_str(), target.c_str(), verdict);
    }
    return std::ranges::all_of(rows_, &Row::reached);
}

int tabulate(const char* program, const std::function<void(SpeedTable&)>& bench) {
    try {
        SpeedTable table;
        bench(table);
        return table.print() ? 0 : 1;
    } catch (const std::exception& error) {
        std::fprintf(stderr, "%s: %s\n", program, error.what());
        return 1;
    }
}

double median(std::vector<double> figures) {
    const auto middle = figures.begin() + static_cast<std::ptrdiff_t>(figures.size() / 2);
    std::ranges::nth_element(figures, middle);
    return *middle;
}

}  // namespace ventras
