#include <strings.h>

#include "zkFilename.h"

int _stricmp(const char* a, const char* b) {
    return strcasecmp(a, b);
}
