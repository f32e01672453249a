// What is shown of the results.
#pragma once

#include "comparison.h"

namespace quillon::bench {

// A line for each operation as it comes.
class Reporter : public benchmark::BenchmarkReporter {
public:
    explicit Reporter(const std::vector<Result> &from) : results(from) {}
    bool ReportContext(const Context &context) override;
    void ReportRuns(const std::vector<Run> &runs) override;

private:
    const std::vector<Result> &results;
};

// Geometric means, and the operations that come out worst.
void printSummary(const std::vector<Result> &results);

std::string summaryText(const std::vector<Result> &results);

// performance.md and performance.svg.
void writeReport(const std::vector<Result> &results, const std::string &folder);

} // namespace quillon::bench
