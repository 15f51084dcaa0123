#include "LEDA/leda.h"
