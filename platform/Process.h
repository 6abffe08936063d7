// Other programs, started with an argument list and driven through pipes. No shell is involved, so
// no character of an argument means anything but itself.
#pragma once

#include <cstddef>
#include <filesystem>
#include <memory>
#include <string>
#include <vector>

namespace kyv {

// The program file that is running.
std::filesystem::path ExecutableFile();

// What becomes of a standard stream of the child.
enum class ChildStream {
    Null, // empty when read, swallowed when written
    Pipe, // ours at the other end
    Own,  // the same as this program's
};

// A running child. Its three streams may be used from three threads; one stream is for one thread
// at a time. They end with the child, even where a program that it has started keeps them open.
// Children do not see the terminal's Ctrl-C: whoever starts them ends them.
class CProcess {
public:
    // Starts a program, found along the search path when its name holds no folder. The arguments
    // are UTF-8, the program's own name excluded. Throws std::system_error when it cannot start.
    CProcess(const std::string& program, const std::vector<std::string>& arguments,
             ChildStream input, ChildStream output, ChildStream error);

    // Ends the child if it still runs.
    ~CProcess();

    CProcess(const CProcess&) = delete;
    CProcess& operator=(const CProcess&) = delete;

    // Up to size bytes of the child's standard output or error; 0 at the end of the stream, and
    // when the child has ended and nothing is left to read.
    size_t ReadOutput(void* buffer, size_t size);
    size_t ReadError(void* buffer, size_t size);

    // Writes all to the child's standard input. False when the child no longer reads or has ended.
    bool WriteInput(const void* data, size_t size);

    // The child sees the end of its standard input.
    void CloseInput();

    // Ends the child at once. Harmless when it has ended, and allowed from any thread.
    void Kill();

    // Waits for the end. The exit status, or 128 and more when a signal ended the child.
    int Wait();

private:
    struct State;
    std::unique_ptr<State> m_pState;
};

} // namespace kyv
