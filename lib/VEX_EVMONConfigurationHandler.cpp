#include "VEX_EVMONConfigurationHandler.h"
