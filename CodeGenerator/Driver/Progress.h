#ifndef PROGRESS_H
#define PROGRESS_H

#include "Road/PassRunner.h"

#include <condition_variable>
#include <mutex>
#include <string>
#include <thread>

namespace hpn {

/// Shows on the error stream, if that is a terminal, which pass is running once it has taken longer
/// than a second, and wipes the line when the pass is over. A thread of its own only waits and
/// prints: it touches neither graph nor library.
class ProgressObserver : public PassObserver {
public:
    ProgressObserver();
    ~ProgressObserver() override;

    void beforePass(const PassStep& Step, ProgramGraph&) override;
    void afterPass(const PassStep&, ProgramGraph&) override;

private:
    void watch();

    bool m_IsTerminal;
    std::mutex m_Mutex;
    std::condition_variable m_Changed;
    std::string m_Running; ///< name of the pass that runs; empty: none
    unsigned m_Serial = 0; ///< changes with each start and end of a pass
    bool m_IsOver = false;
    std::thread m_Watcher; ///< only on a terminal
};

} // namespace hpn

#endif
