#include "VEX_migration.h"
