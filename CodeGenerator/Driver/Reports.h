#ifndef REPORTS_H
#define REPORTS_H

#include "Road/PassRunner.h"
#include "Road/Statistics.h"

#include <string>
#include <vector>

namespace hpn {

/// The statistics as tables to read.
std::string printStatistics(const Statistics& Counts);
/// The same for tools. Times are left out: two runs give the same bytes.
std::string printStatisticsAsJson(const Statistics& Counts, const std::string& ProgramName);

/// Gathers what each pass took.
class TimeObserver : public PassObserver {
public:
    void afterPass(const PassStep& Step, ProgramGraph&) override { m_Steps.push_back(Step); }
    /// One line for each pass: seconds and share of the whole.
    std::string print() const;

private:
    std::vector<PassStep> m_Steps;
};

} // namespace hpn

#endif
