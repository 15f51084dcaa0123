#ifndef CONSTANTEVALUATOR_H
#define CONSTANTEVALUATOR_H

#include "Language/Program.h"

#include <string>

namespace hpn {

/// The number of an expression that holds literals and scalar params only, params standing for
/// their initial values. Recursive, as trees are limited in height.
double evaluateConstant(const Expression* pExpression);

/// What storing a number in a type makes of it, as a warning's text; empty if it stays, rounding to
/// the grid apart.
std::string describeLoss(double Number, const Type& To);

} // namespace hpn

#endif
