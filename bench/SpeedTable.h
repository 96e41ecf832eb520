#pragma once

#include <functional>
#include <string>
#include <string_view>
#include <vector>

namespace ventras {

/// Measured figures beside what they have to reach, for people to read. One thread at a time.
class SpeedTable {
public:
    /// @param unit what the figures count, e.g. "ms"; empty for plain numbers
    void atMost(std::string_view what, double measured, double limit, std::string_view unit);
    void atLeast(std::string_view what, double measured, double limit, std::string_view unit);

    /// A figure that only explains another one.
    void note(std::string_view what, double measured, std::string_view unit);

    /// Writes the table to standard output.
    /// @return whether every figure reaches its target.
    bool print() const;

private:
    struct Row {
        std::string what, measured, target;
        bool reached;
    };
    std::vector<Row> rows_;
};

/// Has a bench fill its table, and prints it.
/// @param program the bench's name, for what goes wrong
/// @return exit status: 0 when every figure reaches its target, else 1.
int tabulate(const char* program, const std::function<void(SpeedTable&)>& bench);

/// The middle one of some figures, the upper one where there are two. There must be at least one.
double median(std::vector<double> figures);

}  // namespace ventras
