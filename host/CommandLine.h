// The command line: verbs, options and help.
#pragma once

#include <string>
#include <vector>

#include "host/ExitStatus.h"

namespace kyvhost {

// Does what the arguments ask. Errors become one line on standard error and the status.
ExitStatus RunCommandLine(const std::vector<std::string>& arguments);

} // namespace kyvhost
