#include "VEX_EVMONPeerGSLivenessHandler.h"
