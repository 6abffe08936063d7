// Starting a program that outlives the one which starts it.
#pragma once

namespace kyvtest {

// Runs the calling program once more, with an argument. The copy holds its standard streams.
void LeaveBehind();

} // namespace kyvtest
