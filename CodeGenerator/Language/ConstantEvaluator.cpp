#include "Language/ConstantEvaluator.h"

#include "Language/NumberText.h"
#include "Model/Conversion.h"
#include "Model/Term.h"

#include <cmath>

namespace hpn {

namespace {

/// Greatest difference that rounding alone makes.
double roundingError(double Number, const Type& To) {
    constexpr double SinglePrecision = 1.0 / (1 << 24);
    constexpr double SmallestSingle = 1e-45;
    constexpr double Slack = 1.0 + 1e-9; // the grid's own numbers are rounded
    if (To.Base == BaseType::Float32) {
        return std::fabs(Number) * SinglePrecision * Slack + SmallestSingle;
    }
    return To.IsScaled ? To.Lsb * 0.5 * Slack : 0.0;
}

} // namespace

double evaluateConstant(const Expression* pExpression) {
    switch (pExpression->Op) {
    case Operator::Number:
        return pExpression->Number;
    case Operator::Variable:
        return pExpression->pVariable->Initial.empty() ? 0.0
                                                       : pExpression->pVariable->Initial.front();
    case Operator::Element:
        return 0.0; // has been refused
    case Operator::Cast:
        return convertNumber(evaluateConstant(pExpression->pLeft), *pExpression->pType);
    default:
        break;
    }
    const double Left = evaluateConstant(pExpression->pLeft);
    if (pExpression->pRight == nullptr) {
        return computeUnary(pExpression->Op, Left);
    }
    return computeBinary(pExpression->Op, Left, evaluateConstant(pExpression->pRight));
}

std::string describeLoss(double Number, const Type& To) {
    const double Stored = convertNumber(Number, To);
    if (std::fabs(Stored - Number) <= roundingError(Number, To)) {
        return {};
    }
    return "initial value " + numberText(Number) + " becomes " + numberText(Stored) + " in type '" +
           std::string(To.Name) + "'";
}

} // namespace hpn
