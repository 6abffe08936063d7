// kyvhost: renders the effects of a KYV DSP module from the command line.
#include "host/CommandLine.h"
#include "host/Interrupt.h"
#include "platform/Console.h"

int main(int argc, char** argv) {
    const std::vector<std::string> arguments = kyv::CommandLineArguments(argc, argv);
    kyv::FailAtFileSizeLimit();
    kyvhost::WatchForInterrupt();
    return static_cast<int>(kyvhost::RunCommandLine(arguments));
}
