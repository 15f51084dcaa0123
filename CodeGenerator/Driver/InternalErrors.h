#ifndef INTERNALERRORS_H
#define INTERNALERRORS_H

#include "ZfCMessageSink.h"
#include "ZfCPlatformMessageServer.h"

#include "Road/PassRunner.h"

namespace hpn {

/// Listens while it lives to what the optimiser reports, prints it to the error stream and counts
/// what says that something inside is broken: messages of the highest severity and, where the
/// checks are on, assertions. One at a time. As an observer it ends the run after the pass that has
/// reported, since nothing that follows could be relied on.
class InternalErrors : public ZfCMessageSink, public PassObserver {
public:
    explicit InternalErrors(bool IsCheckWanted);
    ~InternalErrors() override;
    InternalErrors(const InternalErrors&) = delete;
    InternalErrors& operator=(const InternalErrors&) = delete;

    bool hasAny() const { return s_Count != 0; }
    bool wantsToStop() override { return hasAny(); }

    void receiveMessage(tagERR_error_severity_etp Severity, int Number, const ZfCSrcRef* pSource,
                        const char* Category, const char* Text) override;

private:
    static void countAssertion(const char* File, int Line, const char* Condition);
    [[noreturn]] static void endAfterLayerError(int Number, const char* Text);

    static unsigned s_Count; ///< reports since the only object was made; the hooks take no object

    ZfCMessageSink* m_pFormerSink;
    ZfCPlatformMessageServer::tAssertionHook m_pFormerHook;
    void (*m_pFormerHandler)(int, const char*);
};

} // namespace hpn

#endif
