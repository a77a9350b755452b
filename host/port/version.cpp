#include "host/port/version.h"

const char* lun_version() { return LUN_VERSION; }
