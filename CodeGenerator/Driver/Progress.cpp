#include "Driver/Progress.h"

#include <chrono>
#include <cstdio>
#include <unistd.h>

namespace hpn {

ProgressObserver::ProgressObserver() : m_IsTerminal(isatty(STDERR_FILENO) != 0) {
    if (m_IsTerminal)
        m_Watcher = std::thread([this] { watch(); });
}

ProgressObserver::~ProgressObserver() {
    if (!m_IsTerminal)
        return;
    {
        const std::lock_guard<std::mutex> Lock(m_Mutex);
        m_IsOver = true;
    }
    m_Changed.notify_one();
    m_Watcher.join();
}

void ProgressObserver::beforePass(const PassStep& Step, ProgramGraph&) {
    if (!m_IsTerminal)
        return;
    const std::lock_guard<std::mutex> Lock(m_Mutex);
    m_Running = Step.pPass->Name;
    ++m_Serial;
    m_Changed.notify_one();
}

void ProgressObserver::afterPass(const PassStep&, ProgramGraph&) {
    if (!m_IsTerminal)
        return;
    const std::lock_guard<std::mutex> Lock(m_Mutex);
    m_Running.clear();
    ++m_Serial;
    m_Changed.notify_one();
}

void ProgressObserver::watch() {
    std::unique_lock<std::mutex> Lock(m_Mutex);
    while (!m_IsOver) {
        const unsigned Serial = m_Serial;
        const auto isChanged = [this, Serial] { return m_IsOver || m_Serial != Serial; };
        if (m_Running.empty()) {
            m_Changed.wait(Lock, isChanged);
            continue;
        }
        unsigned Seconds = 0;
        while (!m_Changed.wait_for(Lock, std::chrono::seconds(1), isChanged))
            std::fprintf(stderr, "\rhpncg: %s, %u s ", m_Running.c_str(), ++Seconds);
        // Carriage return and "erase to the end of the line".
        if (Seconds != 0)
            std::fputs("\r\033[K", stderr);
    }
}

} // namespace hpn
