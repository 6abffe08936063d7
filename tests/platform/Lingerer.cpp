// Says one word and ends, and leaves a program behind that holds its streams for as long as
// somebody reads its errors.
#include <cstdio>

#include "platform/Threads.h"
#include "tests/platform/LeaveBehind.h"

int main(int count, char**) {
    if (count == 1) {
        kyvtest::LeaveBehind();
        std::puts("hello");
        return 0;
    }
    std::setvbuf(stderr, nullptr, _IONBF, 0); // or it notices only after a buffer full of dots
    while (std::fputc('.', stderr) != EOF) {
        kyv::SleepMs(20);
    }
    return 0;
}
