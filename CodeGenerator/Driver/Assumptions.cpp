#include "Driver/Assumptions.h"

#include "Language/ConstantEvaluator.h"
#include "Language/NumberText.h"
#include "Model/Conversion.h"

#include <cmath>
#include <cstdlib>

namespace hpn {

namespace {

bool splitName(const std::string& Text, const char* Form, std::string& Name, std::string& Rest,
               std::string& Why) {
    const std::size_t Sign = Text.find('=');
    if (Sign == std::string::npos || Sign == 0 || Sign + 1 == Text.size()) {
        Why = "'" + Text + "' is not of the form " + Form;
        return false;
    }
    Name = Text.substr(0, Sign);
    Rest = Text.substr(Sign + 1);
    return true;
}

bool readNumber(const std::string& Text, double& Number, std::string& Why) {
    if (Text == "true" || Text == "false") {
        Number = Text == "true" ? 1.0 : 0.0;
        return true;
    }
    char* pEnd = nullptr;
    Number = std::strtod(Text.c_str(), &pEnd);
    if (!Text.empty() && *pEnd == '\0' && std::isfinite(Number))
        return true;
    Why = "'" + Text + "' is no number";
    return false;
}

Variable* findVariable(Program& In, const std::string& Name, VariableKind Kind, const char* Word,
                       std::string& Why) {
    for (Variable& Each : In.Variables) {
        if (Each.pOwner != nullptr || Each.Name != Name)
            continue;
        if (Each.Kind == Kind)
            return &Each;
        Why = "'" + Name + "' is no " + Word;
        return nullptr;
    }
    Why = std::string("the program has no ") + Word + " '" + Name + "'";
    return nullptr;
}

// The ends drawn in to numbers that the type has. False: it has none between them.
bool drawIn(const Type& Of, double& Low, double& High) {
    if (isFloating(Of.Base))
        return true;
    constexpr double Slack = 1e-9;
    const double Lsb = Of.IsScaled ? Of.Lsb : 1.0;
    const double Offset = Of.IsScaled ? Of.Offset : 0.0;
    const double First = std::ceil((Low - Offset) / Lsb - Slack);
    const double Last = std::floor((High - Offset) / Lsb + Slack);
    Low = First * Lsb + Offset;
    High = Last * Lsb + Offset;
    return First <= Last;
}

} // namespace

bool Assumptions::addSetting(const std::string& Text, std::string& Why) {
    Setting New;
    if (!splitName(Text, "NAME=VALUE", New.Name, New.Text, Why) ||
        !readNumber(New.Text, New.Value, Why))
        return false;
    m_Settings.push_back(New);
    return true;
}

bool Assumptions::addRange(const std::string& Text, std::string& Why) {
    Range New;
    if (!splitName(Text, "INPUT=LO..HI", New.Name, New.Text, Why))
        return false;
    const std::size_t Dots = New.Text.find("..");
    if (Dots == std::string::npos) {
        Why = "'" + New.Text + "' is not of the form LO..HI";
        return false;
    }
    if (!readNumber(New.Text.substr(0, Dots), New.Low, Why) ||
        !readNumber(New.Text.substr(Dots + 2), New.High, Why))
        return false;
    if (New.Low > New.High) {
        Why = "'" + New.Text + "' is empty: its lower end is the greater one";
        return false;
    }
    m_Ranges.push_back(New);
    return true;
}

void Assumptions::prepare(Program& Target) const {
    for (const Setting& Each : m_Settings)
        Target.Settings.emplace_back(Each.Name, Each.Value);
}

bool Assumptions::apply(Program& Target, std::string& Why) const {
    for (const Setting& Each : m_Settings) {
        const Variable* pParam = findVariable(Target, Each.Name, VariableKind::Param, "param", Why);
        if (pParam == nullptr)
            Why = "--set: " + Why;
        else if (pParam->Count != 0)
            Why = "--set: '" + Each.Name + "' is an array";
        else if (!describeLoss(Each.Value, *pParam->pType).empty())
            Why = "--set: " + Each.Text + " is no value of '" + Each.Name + "': it would become " +
                  numberText(convertNumber(Each.Value, *pParam->pType));
        if (!Why.empty())
            return false;
    }
    for (const Range& Each : m_Ranges)
        if (!applyRange(Each, Target, Why)) {
            Why = "--range: " + Why;
            return false;
        }
    return true;
}

bool Assumptions::applyRange(const Range& Believed, Program& Target, std::string& Why) {
    Variable* pInput = findVariable(Target, Believed.Name, VariableKind::Input, "input", Why);
    if (pInput == nullptr)
        return false;
    const ValueRange Storage = storageRange(*pInput->pType);
    double Low = Believed.Low;
    double High = Believed.High;
    if (Low < Storage.Low || High > Storage.High) {
        Why = Believed.Text + " is more than '" + Believed.Name +
              "' can hold: " + numberText(Storage.Low) + ".." + numberText(Storage.High);
        return false;
    }
    if (!drawIn(*pInput->pType, Low, High)) {
        Why = "'" + Believed.Name + "' can hold no number in " + Believed.Text;
        return false;
    }
    pInput->HasBelievedRange = true;
    pInput->BelievedLow = Low;
    pInput->BelievedHigh = High;
    return true;
}

std::vector<std::string> Assumptions::describe() const {
    std::vector<std::string> Sentences;
    for (const Setting& Each : m_Settings)
        Sentences.push_back("param " + Each.Name + " is " + Each.Text + " (--set)");
    for (const Range& Each : m_Ranges)
        Sentences.push_back("input " + Each.Name + " is believed to stay in " + Each.Text +
                            " (--range)");
    return Sentences;
}

} // namespace hpn
