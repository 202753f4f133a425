#include "zkutilVersion.h"

const char* zkutilVersion() {
    return ZKUTIL_VERSION;
}
