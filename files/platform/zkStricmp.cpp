#include "zkFilename.h"

#include <strings.h>

int _stricmp(const char* a, const char* b) {
    return strcasecmp(a, b);
}
