#include "VEX_EVMONSiteConfigEventHandler.h"
