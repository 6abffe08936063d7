// What is not kept, said before it is lost.
#pragma once

#include <string>
#include <vector>

namespace kyvhost {

class CNotes {
public:
    // strict: a loss is an error. quiet: nothing is said.
    CNotes(bool quiet, bool strict) : m_bQuiet(quiet), m_bStrict(strict) {}

    // A line on standard error; the same one only once. Throws CHostError with RenderingFailed when
    // losses are errors.
    void Say(const std::string& loss);

    // A line that tells no loss.
    void Tell(const std::string& line) const;

private:
    bool m_bQuiet, m_bStrict;
    std::vector<std::string> m_said;
};

} // namespace kyvhost
