#include "ZfCMemController.h"

ZfCMemController* pZFMemory = nullptr;
