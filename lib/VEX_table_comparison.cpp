#include "VEX_EVMONHandler.h"
