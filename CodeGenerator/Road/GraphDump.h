#ifndef GRAPHDUMP_H
#define GRAPHDUMP_H

#include "Model/Term.h"
#include "Road/PassRunner.h"
#include "ZfCCfgVisitorSSADot.h"

#include <ostream>
#include <string>
#include <vector>

namespace hpn {

/// The client's dump of the graph: the library's DOT file, with assignments and expressions written
/// out. A variable in an expression shows as `Var_12:target`: the number under which the rest of
/// the dump and the HTML table know the version, and the name in the source.
class GraphDump : public ZfCCfgVisitorSSADot {
public:
    explicit GraphDump(ZfCControlFlowGraph& Graph) : ZfCCfgVisitorSSADot(&Graph, true, false) {}

    using ZfCCfgVisitorSSADot::visit;
    void visit(ZfCCfgAssignment* pAssignment) override;
    void visit(ZfCCfgExpression* pExpression) override;
    /// The number in the names of the files.
    unsigned getSerial() { return getIndex(); }

private:
    void printExpression(ZfCCfgExpression* pExpression);
};

/// Writes a term as text, every operation in parentheses; versions show as in `GraphDump`. Needs no
/// stack for deep terms.
void writeTerm(const Term* pRoot, std::ostream& Stream);

/// Writes `DIR/NN_pass_SF_N.dot` after each pass (00 is the graph as built) and, where wanted, the
/// table of the printed variables beside it. The directories have to exist.
class DumpObserver : public PassObserver {
public:
    /// An empty directory: that kind of file is not wanted.
    DumpObserver(std::string DotDirectory, std::string HtmlDirectory);

    void beforeAll(ProgramGraph& Graph) override;
    void afterPass(const PassStep& Step, ProgramGraph& Graph) override;
    /// A file that could not be written whole; empty if there is none. The run stops there.
    const std::string& getFailedFile() const { return m_FailedFile; }
    bool wantsToStop() override { return !m_FailedFile.empty(); }

private:
    void dump(unsigned Number, const char* Name, ProgramGraph& Graph);
    void checkFile(const std::string& FileName, const char* LastText);

    std::string m_DotDirectory;
    std::string m_HtmlDirectory;
    std::string m_FailedFile;
};

} // namespace hpn

#endif
