#include "VEX_EVMONRepositoryDiskHandler.h"
