#ifndef REPORTS_H
#define REPORTS_H

#include "Road/PassRunner.h"
#include "Road/Statistics.h"

#include <string>
#include <vector>

namespace hpn {

/// The statistics as tables to read.
std::string printStatistics(const Statistics& Counts);
/// What the assumptions of a run changed, from the statistics of the run without them.
std::string printComparison(const Statistics& Without, const Statistics& With,
                            const std::vector<std::string>& Assumptions);
/// The statistics for tools; `pWithout`, if not null, is the run without the assumptions. Times are
/// left out: two runs give the same bytes.
std::string printStatisticsAsJson(const Statistics& Counts, const std::string& ProgramName,
                                  const std::vector<std::string>& Assumptions = {},
                                  const Statistics* pWithout = nullptr);

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
