#include "ZfCCfgVisitor.h"

ZfCCfgVisitor::~ZfCCfgVisitor() = default;
