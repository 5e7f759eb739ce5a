#include "hb_communication/vex_table_build.h"
