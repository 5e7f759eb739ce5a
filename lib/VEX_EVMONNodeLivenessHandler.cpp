#include "VEX_EVMONNodeLivenessHandler.h"
