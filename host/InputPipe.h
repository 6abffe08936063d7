// An input that can be read only once: standard input, or a pipe that goes by a name.
#pragma once

#include <cstddef>
#include <cstdint>
#include <filesystem>
#include <fstream>
#include <functional>
#include <mutex>
#include <span>
#include <vector>

namespace kyvhost {

// Keeps what has been read until it is decided what becomes of it, so that a program can look at
// the beginning and another one read it all.
class CInputPipe {
public:
    explicit CInputPipe(const std::filesystem::path& file);

    // The first bytes, up to size of them; fewer only at the end. They stay to be read.
    std::span<const uint8_t> Peek(size_t size);

    // Everything, to the end.
    std::span<const uint8_t> ReadAll();

    // Hands on everything from the first byte, as it comes, until take returns false. With keep
    // it all stays to be read.
    void Pass(const std::function<bool(const void*, size_t)>& take, bool keep);

private:
    bool ReadMore();

    std::mutex m_mutex; // one that passes at a time
    std::ifstream m_stream;
    bool m_bStandard;
    std::vector<uint8_t> m_kept;
};

} // namespace kyvhost
