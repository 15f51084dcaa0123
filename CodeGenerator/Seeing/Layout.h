#ifndef LAYOUT_H
#define LAYOUT_H

#include "Seeing/Recording.h"

#include <unordered_map>
#include <vector>

namespace hpn {

/// Where the statements of one snapshot stand, in order of procedures and nodes. The recording must
/// outlive it and keep its pools.
class Layout {
public:
    struct Entry {
        int State = -1;     ///< index into Statements
        unsigned Node = 0;  ///< id
        int Procedure = -1; ///< index into Procedures
    };

    Layout(const Recording& Of, const RecordedSnapshot& Snapshot);

    const std::vector<Entry>& getEntries() const { return m_Entries; }
    /// By id of the statement; null: it does not stand there.
    const Entry* find(unsigned StatementId) const;

private:
    std::vector<Entry> m_Entries;
    std::unordered_map<unsigned, std::size_t> m_Places; // looked up only
};

/// Fills changes, marks and tally of the last snapshot of a recording from the one before it. Why
/// something was done is not known here.
void compareLastSnapshots(Recording& Of, bool IsInlining, bool IsHoisting);

} // namespace hpn

#endif
