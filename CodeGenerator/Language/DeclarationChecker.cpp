#include "Language/DeclarationChecker.h"

#include "Language/ConstantEvaluator.h"
#include "Language/NumberText.h"
#include "Model/Conversion.h"

#include <algorithm>
#include <cmath>
#include <utility>

namespace hpn {

void DeclarationChecker::run() {
    for (const PendingVariable& Pending : m_State.Variables) {
        completeVariable(Pending);
    }
    for (const PendingAccess& Access : m_State.Accesses) {
        completeAccess(Access);
    }
    for (Variable& Each : m_State.Target.Variables) {
        if (Each.Initial.empty()) {
            Each.Initial.push_back(convertNumber(0.0, *Each.pType));
        }
    }
    checkMain();
}

void DeclarationChecker::completeVariable(const PendingVariable& Pending) {
    if (completeCount(Pending) && checkInitializer(Pending)) {
        computeInitial(*Pending.pVariable);
    }
}

bool DeclarationChecker::completeCount(const PendingVariable& Pending) {
    if (Pending.pCount == nullptr) {
        return true;
    }
    const double Count = evaluateConstant(Pending.pCount);
    if (!(Count >= 1.0 && Count <= GreatestCount) || Count != std::trunc(Count)) {
        m_State.Messages.error(Pending.pCount->Position,
                               "an array has 1 to 65536 elements, not " + numberText(Count));
        return false;
    }
    m_Elements += static_cast<std::size_t>(Count);
    if (m_Elements > GreatestTotal) {
        m_State.Messages.error(Pending.pCount->Position,
                               "the arrays of a program have at most 4194304 elements together");
        return false;
    }
    Pending.pVariable->Count = static_cast<std::uint32_t>(Count);
    return true;
}

bool DeclarationChecker::checkInitializer(const PendingVariable& Pending) {
    const Variable& Target = *Pending.pVariable;
    const std::string Name = quotedName(Target.Name);
    const SourcePosition Position = Pending.InitializerPosition;
    if (!Target.HasInitializer) {
        if (Target.Kind != VariableKind::Param) {
            return true;
        }
        m_State.Messages.error(Target.Position, "param " + Name + " needs a value");
        return false;
    }
    if (Target.Kind == VariableKind::Input) {
        m_State.Messages.error(Position, "input " + Name + " gets its value from outside");
        return false;
    }
    if (Target.Count == 0 && Pending.HasBraces) {
        m_State.Messages.error(Position, Name + " is not an array");
        return false;
    }
    if (Target.Count != 0 && !Pending.HasBraces) {
        m_State.Messages.error(Position, "array " + Name + " takes its values in braces");
        return false;
    }
    return true;
}

void DeclarationChecker::computeInitial(Variable& Target) {
    const std::size_t Wanted = std::max<std::size_t>(Target.Count, 1);
    Target.Initial.reserve(Wanted);
    for (const Expression* pValue = Target.pInitializer; pValue != nullptr;
         pValue = pValue->pNext) {
        if (Target.Initial.size() == Wanted) {
            m_State.Messages.error(pValue->Position, "more values than the " +
                                                         std::to_string(Target.Count) +
                                                         " elements of the array");
            return;
        }
        const double Number = evaluateConstant(pValue);
        const double Stored = convertNumber(Number, *Target.pType);
        if (!std::isfinite(Number) || !std::isfinite(Stored)) {
            m_State.Messages.error(pValue->Position, "an initial value must be a finite number");
        } else if (std::string Loss = describeLoss(Number, *Target.pType); !Loss.empty()) {
            m_State.Messages.warning(pValue->Position, std::move(Loss));
        }
        Target.Initial.push_back(Stored);
    }
    Target.Initial.resize(Wanted, convertNumber(0.0, *Target.pType));
    if (Target.Kind == VariableKind::Param && Target.Count == 0)
        applySettings(Target);
}

void DeclarationChecker::applySettings(Variable& Target) const {
    for (const auto& [Name, Value] : m_State.Target.Settings)
        if (Name == Target.Name)
            Target.Initial.front() = convertNumber(Value, *Target.pType);
}

void DeclarationChecker::completeAccess(const PendingAccess& Access) {
    NameEntry& Entry = m_State.Names[Access.Name];
    const std::string Name = quotedName(Entry.Text);
    if (Entry.Kind != SymbolKind::Variable) {
        if (!Entry.IsSuspect) {
            m_State.Messages.error(Access.Position, Name + " is not a variable of the program");
        }
        return;
    }
    Variable* pVariable = Entry.pVariable;
    if (Access.IsWrite && pVariable->Kind == VariableKind::Input) {
        m_State.Messages.error(Access.Position, "an extern cannot write input " + Name);
    } else if (Access.IsWrite && pVariable->Kind == VariableKind::Param) {
        m_State.Messages.error(Access.Position, "an extern cannot write param " + Name);
    }
    auto& List = Access.IsWrite ? Access.pExtern->Writes : Access.pExtern->Reads;
    m_LastList.resize(m_State.Target.Variables.size());
    if (std::exchange(m_LastList[pVariable->Index], &List) == &List) {
        m_State.Messages.error(Access.Position, Name + " is listed twice");
        return;
    }
    List.push_back(pVariable);
}

void DeclarationChecker::checkMain() {
    for (Procedure& Each : m_State.Target.Procedures) {
        if (Each.Name != "main") {
            continue;
        }
        Each.IsMain = true;
        m_State.Target.pMain = &Each;
        if (Each.IsExported) {
            m_State.Messages.error(Each.Position, "'main' cannot be exported");
        }
        if (!Each.Formals.empty()) {
            m_State.Messages.error(Each.Formals.front()->Position, "'main' has no formals");
        }
        if (Each.pResult != nullptr) {
            m_State.Messages.error(Each.Position, "'main' has no result");
        }
        return;
    }
    // A text with other mistakes may have lost its main by one of them.
    if (!m_State.Messages.hasErrors()) {
        m_State.Messages.error({}, "the program has no procedure 'main'");
    }
}

} // namespace hpn
