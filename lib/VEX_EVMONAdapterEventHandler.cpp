#include "VEX_EVMONAdapterEventHandler.h"
