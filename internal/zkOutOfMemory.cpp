#include "zkOutOfMemory.h"

#include <unistd.h>

#include <cstdlib>

void zkOutOfMemory() {
    // write(2) rather than stdio: nothing here may need memory.
    static const char kMessage[] = "out of memory\n";
    ssize_t ignored = write(STDERR_FILENO, kMessage, sizeof kMessage - 1);
    (void)ignored;
    std::_Exit(1);
}
