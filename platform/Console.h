// What a command-line program asks of the system around it.
#pragma once

#include <cstddef>
#include <functional>
#include <string>
#include <vector>

namespace kyv {

// The arguments in UTF-8, without the program's own name. Also readies the console for UTF-8.
std::vector<std::string> CommandLineArguments(int argc, char** argv);

// Whether standard error goes to a terminal, where a line can be written over.
bool ErrorIsTerminal();

// Calls action when the user interrupts the program (Ctrl-C, or a request to end). It runs on a
// thread of its own, so it may lock and allocate. Call this once, before starting other threads.
void OnInterrupt(std::function<void()> action);

// Up to size bytes of the program's own standard input, as they are; 0 at the end.
size_t ReadStandardInput(void* buffer, size_t size);

// A file that grows past the system's limit for files makes writing fail from now on, here and in
// children, in place of ending the program before it can tidy up.
void FailAtFileSizeLimit();

} // namespace kyv
