#ifndef RANGEPROOF_H
#define RANGEPROOF_H

#include "Language/Program.h"
#include "Model/ValueRange.h"

#include <cstdint>
#include <string>
#include <vector>

namespace hpn::proof {

/// Sixteen numbers that a type of four bits holds, on a grid: `Raw * Lsb + Offset`.
struct Domain {
    std::string Name;
    int FirstRaw;
    double Lsb;
    double Offset;
};

/// A type that the results are stored in. The language has no storage of four bits; those used here
/// wrap and clip just where the results of the domains lie.
struct Store {
    std::string Name;
    Type To;
};

/// What the client said of one pair of intervals (or one interval), and what is so.
struct Case {
    ValueRange Left;
    ValueRange Right; ///< of unary operators: the same as Left
    ValueRange Claimed;
    ValueRange Seen;
};

/// One operator on one domain, its results as they are or stored in one type.
struct Finding {
    std::string Name;         ///< operator as written in the language
    const Domain* pDomain;    ///< of the left or only operand
    const Domain* pRight;     ///< of the right operand
    const Store* pStore;      ///< null: the operator's result itself
    std::uint64_t Cases = 0;  ///< intervals, or pairs of intervals
    std::uint64_t Narrow = 0; ///< too narrow: a fault
    std::uint64_t Exact = 0;  ///< as narrow as an interval can be
    Case FirstNarrow;         ///< if there is any
    std::vector<Case> Wide;   ///< the others: all if so asked, else the first
};

const std::vector<Domain>& domains();
const std::vector<Store>& stores();

/// Claims of the client's interval arithmetic for every interval or pair of intervals of every
/// domain, for every operator and every store behind it, compared with all their numbers by exact
/// arithmetic. In order of domain, operator, store. Takes seconds.
std::vector<Finding> proveRanges(bool KeepAllCases);

/// Operator, domain, store and counts of one finding, without the line's end.
std::string describe(const Finding& Of);
/// A table of all findings that are not exact throughout, with the first case of each, between
/// figures for all of them. Two runs give identical text.
std::string printTable(const std::vector<Finding>& Findings);
/// Every case that is not as narrow as possible.
std::string printWideCases(const std::vector<Finding>& Findings);

} // namespace hpn::proof

#endif
