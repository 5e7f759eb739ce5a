#include "VEX_EVMONReconfigEventHandler.h"
