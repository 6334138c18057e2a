// A number that threads share. Not std::atomic<double>, which needs a library of its own on 32-bit MIPS.
#ifndef TELIX_SRC_AVCONTROL_SHAREDNUMBER_H
#define TELIX_SRC_AVCONTROL_SHAREDNUMBER_H

#include <mutex>

class SharedNumber {
public:
    explicit SharedNumber(double value) : m_value(value) {}
    SharedNumber(const SharedNumber&) = delete;
    ~SharedNumber() = default;

    SharedNumber& operator=(const SharedNumber&) = delete;
    SharedNumber& operator=(double value) {
        const std::lock_guard<std::mutex> lock(m_mutex);
        m_value = value;
        return *this;
    }
    operator double() const {
        const std::lock_guard<std::mutex> lock(m_mutex);
        return m_value;
    }

private:
    mutable std::mutex m_mutex;
    double m_value;
};

#endif
