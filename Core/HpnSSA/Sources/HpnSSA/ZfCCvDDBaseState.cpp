#include "ZfCCvDDBaseState.h"
