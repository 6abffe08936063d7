// What hosting throws. The text of each is one line without a full stop: it names what was wrong
// and what would be right, and does not know who shows it.
#pragma once

#include <stdexcept>
#include <string>

#include "interface/HostInterface.h"

namespace kyvhosting {

class CError : public std::runtime_error {
public:
    using std::runtime_error::runtime_error;
};

// A name that nothing has, or a value that a parameter cannot take.
class CUsageError : public CError {
public:
    using CError::CError;
};

// The module is missing, no library, lacks an export, refuses to start or is of another format.
class CModuleError : public CError {
public:
    using CError::CError;
};

// A callback gave a status other than success.
class CCallError : public CError {
public:
    CCallError(const std::string& text, KyvStatus status) : CError(text), m_status(status) {}

    KyvStatus Status() const { return m_status; }

private:
    KyvStatus m_status;
};

} // namespace kyvhosting
