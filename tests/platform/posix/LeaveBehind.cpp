// A second program on Linux.
#include "tests/platform/LeaveBehind.h"

#include <unistd.h>

namespace kyvtest {

void LeaveBehind() {
    if (fork() == 0) {
        execl("/proc/self/exe", "lingerer", "stay", nullptr);
        _exit(1);
    }
}

} // namespace kyvtest
