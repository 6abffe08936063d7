// The host's suites.
#include "bridges/openfx/Suites.h"

namespace kyvofx {
namespace {

Suites g_suites;
std::atomic<Host*> g_host = nullptr;

template <class Suite>
void Fetch(std::atomic<const Suite*>& suite, const char* name, int version = 1) {
    const Host* const host = g_host;
    suite = static_cast<const Suite*>(host->fetchSuite(host->host, name, version));
}

} // namespace

const Suites& GetSuites() {
    return g_suites;
}

void SetHost(Host* host) {
    if (host) {
        g_host = host;
    }
}

bool FetchSuites() {
    const Host* const host = g_host;
    if (!host || !host->fetchSuite) {
        return false;
    }
    Fetch(g_suites.property, suite::kProperty);
    Fetch(g_suites.parameter, suite::kParameter);
    Fetch(g_suites.effect, suite::kImageEffect);
    Fetch(g_suites.message, suite::kMessage);
    Fetch(g_suites.interact, suite::kInteract);
    Fetch(g_suites.draw, suite::kDraw);
    return g_suites.property && g_suites.parameter && g_suites.effect;
}

bool CProps::Set(const char* name, int value, int index) {
    return m_set && GetSuites().property.load()->setInt(m_set, name, index, value) == kStatOk;
}

bool CProps::Set(const char* name, double value, int index) {
    return m_set && GetSuites().property.load()->setDouble(m_set, name, index, value) == kStatOk;
}

bool CProps::Set(const char* name, const char* value, int index) {
    return m_set && GetSuites().property.load()->setString(m_set, name, index, value) == kStatOk;
}

bool CProps::Set(const char* name, void* value) {
    return m_set && GetSuites().property.load()->setPointer(m_set, name, 0, value) == kStatOk;
}

int CProps::Int(const char* name, int fallback, int index) const {
    int number = fallback;
    const bool isRead =
        m_set && GetSuites().property.load()->getInt(m_set, name, index, &number) == kStatOk;
    return isRead ? number : fallback;
}

double CProps::Double(const char* name, double fallback, int index) const {
    double number = fallback;
    const bool isRead =
        m_set && GetSuites().property.load()->getDouble(m_set, name, index, &number) == kStatOk;
    return isRead ? number : fallback;
}

const char* CProps::String(const char* name) const {
    char* text = nullptr;
    const bool isRead =
        m_set && GetSuites().property.load()->getString(m_set, name, 0, &text) == kStatOk;
    return isRead && text ? text : "";
}

void* CProps::Pointer(const char* name) const {
    void* pointer = nullptr;
    const bool isRead =
        m_set && GetSuites().property.load()->getPointer(m_set, name, 0, &pointer) == kStatOk;
    return isRead ? pointer : nullptr;
}

bool CProps::Ints(const char* name, int count, int* values) const {
    return m_set && GetSuites().property.load()->getIntN(m_set, name, count, values) == kStatOk;
}

CProps PropsOf(EffectHandle effect) {
    PropertySetHandle set = nullptr;
    const bool isRead =
        effect && GetSuites().effect.load()->getPropertySet(effect, &set) == kStatOk;
    return CProps(isRead ? set : nullptr);
}

} // namespace kyvofx
