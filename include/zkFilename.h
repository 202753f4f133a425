// The platform file layer: the small set of path and file primitives that
// the rest of the library stands on.
#ifndef ZK_FILENAME_H
#define ZK_FILENAME_H

#include "zkExport.h"

// Compares two zero-terminated strings without regard to letter case (the
// current locale's tolower): 0 when equal, else negative or positive as a
// sorts before or after b.
ZK_API int _stricmp(const char* a, const char* b);

#endif
