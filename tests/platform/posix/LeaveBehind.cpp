// A second program on Linux.
#include "tests/platform/LeaveBehind.h"

#include <unistd.h>

namespace kyvtest {

void LeaveBehind() {
    if (fork() == 0) {
        execl(KYV_LINGERER_FILE, "lingerer", "stay", nullptr);
        _exit(1);
    }
}

} // namespace kyvtest
