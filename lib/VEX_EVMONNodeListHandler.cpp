#include "VEX_EVMONNodeListHandler.h"
