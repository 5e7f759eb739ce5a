#include "VEX_EVMONSplitMergeEventHandler.h"
