#ifndef VALUERANGE_H
#define VALUERANGE_H

#include "Language/Program.h"

#include <algorithm>
#include <cstdint>

namespace hpn {

/// What is known of a number at run time without knowing the number: the closed interval of the
/// ordinary numbers it can be (infinities included), and whether it can be a NaN or a negative zero
/// besides. An empty interval (`Low` greater than `High`) says that it can be nothing but a NaN.
/// Both zeros count as 0.0 in the interval.
struct ValueRange {
    double Low = 0.0;
    double High = 0.0;
    bool MayBeNaN = false;
    bool MayBeNegativeZero = false;
    bool IsIntegral = false; ///< every number in it is a whole number (or it is empty); never true
                             ///< with infinite ends
    /// More than 0: every number in it, and High, is Low plus a whole multiple of this, exactly.
    /// Kept for the grids of scaled types only; whole numbers without a gap have 0 here.
    double Step = 0.0;
    /// More than 0: no number in it but the zeros is nearer to zero. For grids that double
    /// arithmetic does not hit exactly.
    double Least = 0.0;

    bool isEmpty() const { return Low > High; }
    /// Nothing is known of the numbers between the ends but that they may be whole.
    bool isPlain() const { return Step == 0.0 && Least == 0.0; }
    /// One number and nothing else: not a NaN, and of one sign if it is zero.
    bool isSingle() const { return Low == High && !MayBeNaN && !MayBeNegativeZero; }
    bool contains(double Number) const;
    /// Inside [Low, High] of another, with no NaN or negative zero that the other lacks.
    bool isWithin(const ValueRange& Other) const;
};

/// Just this number; a NaN gives the empty interval with MayBeNaN.
ValueRange rangeOfNumber(double Number);
/// Every double there is.
ValueRange rangeOfAnything();
/// Gives a range between finite ends the grid of a step from its lower end, if all of its numbers
/// are so few and so coarse that sums of them are exact; else nothing changes.
void setStep(ValueRange& Range, double Step);
/// What of a range lies between two numbers, its ends on its grid; empty if nothing does. Negative
/// zeros and NaNs stay flagged.
ValueRange cutRange(const ValueRange& Range, double Low, double High);
/// The ends of what is left of First, First + Step, ... up to First + Width modulo Period (at most
/// 2^32). Exact for few numbers, and where nothing but the order of the periods is lost.
struct Residues {
    std::int64_t Low;
    std::int64_t High;
};
Residues residuesOf(std::int64_t First, std::uint64_t Width, std::int64_t Step,
                    std::int64_t Period);
/// What a hull of two ranges knows between its ends.
void setGapsOfHull(ValueRange& Result, const ValueRange& a, const ValueRange& b);
/// Smallest range that holds both.
inline ValueRange hull(const ValueRange& a, const ValueRange& b) {
    ValueRange Result;
    Result.Low = std::min(a.Low, b.Low);
    Result.High = std::max(a.High, b.High);
    Result.MayBeNaN = a.MayBeNaN || b.MayBeNaN;
    Result.MayBeNegativeZero = a.MayBeNegativeZero || b.MayBeNegativeZero;
    Result.IsIntegral = (a.IsIntegral || a.isEmpty()) && (b.IsIntegral || b.isEmpty());
    if (!a.isPlain() || !b.isPlain())
        setGapsOfHull(Result, a, b);
    return Result;
}

/// What the operator gives for operands out of the given ranges. Never too narrow under the
/// arithmetic of `Term`s; as narrow as an interval can be for nearly all operands. `Op` is one of
/// the unary or binary operators (not Number, Variable, Element, Cast).
ValueRange rangeOfUnary(Operator Op, const ValueRange& Operand);
ValueRange rangeOfBinary(Operator Op, const ValueRange& Left, const ValueRange& Right);

} // namespace hpn

#endif
