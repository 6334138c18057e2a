// One request of the control socket, parsed and checked against its row of the command table.
#ifndef TELIX_DESKTOP_PLATFORM_CONTROLREQUEST_H
#define TELIX_DESKTOP_PLATFORM_CONTROLREQUEST_H

#include <cstdint>
#include <map>
#include <stdexcept>
#include <string>
#include <variant>
#include <vector>

#include "desktop/platform/ControlProtocol.h"

namespace desktop {

// Why a request fails. Its message goes into the response.
class ControlError : public std::runtime_error {
public:
    using std::runtime_error::runtime_error;
};

inline void require(bool condition, const char* otherwise) {
    if (!condition) {
        throw ControlError(otherwise);
    }
}

class ControlRequest {
public:
    // Parses one line, without its end. Throws ControlError. Required parameters are present afterwards, and
    // all values have the types and limits of the command table.
    static ControlRequest parse(const std::string& line);

    const ControlCommand& command() const { return *m_command; }

    bool has(const char* name) const { return m_values.count(name) != 0; }

    // The value of a parameter of that type, which must be present unless there is a default.
    int64_t number(const char* name) const { return std::get<int64_t>(m_values.at(name)); }
    bool boolean(const char* name) const { return std::get<bool>(m_values.at(name)); }
    std::string string(const char* name, const std::string& defaultValue = "") const {
        return has(name) ? std::get<std::string>(m_values.at(name)) : defaultValue;
    }
    const std::vector<std::string>& strings(const char* name) const {
        return std::get<std::vector<std::string>>(m_values.at(name));
    }

    // How long the command may wait for something, in seconds; 0 for a command that does not wait.
    int64_t timeout() const { return has("timeout") ? number("timeout") : m_command->defaultTimeout(); }

    using Value = std::variant<std::string, std::vector<std::string>, int64_t, bool>;

private:
    const ControlCommand* m_command = nullptr;
    std::map<std::string, Value> m_values;
};

} // namespace desktop

#endif
