#include "VEX_EVMONIPChangeEventHandler.h"
