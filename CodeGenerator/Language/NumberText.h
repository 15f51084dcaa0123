#ifndef NUMBERTEXT_H
#define NUMBERTEXT_H

#include <string>

namespace hpn {

/// Appends a number in the shortest form that reads back as the same double: whole numbers below
/// 1e15 as digits, others as decimals. Numbers that have no literal (infinities, NaN) appear as
/// "inf" and "nan", for messages.
void appendNumber(std::string& Out, double Number);
std::string numberText(double Number);

} // namespace hpn

#endif
