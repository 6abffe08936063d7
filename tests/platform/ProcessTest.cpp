// A child's streams end with the child.
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "platform/Process.h"

namespace {

using kyv::ChildStream;
using kyv::CProcess;

// The child says one word and ends. What it has started keeps all its streams, reads nothing and
// stays until nobody hears it any more.
TEST(Process, StreamsEndWithTheChildThoughAnotherHoldsThem) {
    CProcess process(KYV_LINGERER_FILE, {}, ChildStream::Pipe, ChildStream::Pipe,
                     ChildStream::Pipe);
    std::string said;
    char buffer[100];
    while (const size_t count = process.ReadOutput(buffer, sizeof buffer)) {
        said.append(buffer, count);
    }
    EXPECT_EQ(said.substr(0, 5), "hello");
    EXPECT_EQ(process.Wait(), 0);
    const std::vector<char> moreThanThePipeTakes(8 << 20);
    EXPECT_FALSE(process.WriteInput(moreThanThePipeTakes.data(), moreThanThePipeTakes.size()));
}

} // namespace
