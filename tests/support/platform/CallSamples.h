// Every call of the platform at once: arguments of all types to make each call with, and a walk over the
// list.
#ifndef TELIX_TESTS_SUPPORT_PLATFORM_CALLSAMPLES_H
#define TELIX_TESTS_SUPPORT_PLATFORM_CALLSAMPLES_H

#include "telix/telix_platform.h"

#include <algorithm>
#include <array>
#include <cstddef>
#include <cstdint>
#include <string>
#include <tuple>
#include <type_traits>
#include <vector>

// One argument after the other, no two alike: numbers with bits in each of their bytes, strings, and pointers
// to memory whose content shows whether anything was written there.
class ArgumentSource {
public:
    ArgumentSource() {
        for (auto& block : m_memory) {
            block.fill(untouchedByte);
        }
    }

    template <class Argument>
    Argument next() {
        ++m_index;
        const bool isLengthOfBytes = m_lastWasBytes;
        m_lastWasBytes = std::is_same_v<Argument, const ___UINT8*>;
        if constexpr (std::is_same_v<Argument, const char*>) {
            return texts[m_index];
        } else if constexpr (std::is_pointer_v<Argument>) {
            return reinterpret_cast<Argument>(m_memory[m_index].data());
        } else {
            return static_cast<Argument>(isLengthOfBytes ? blockSize : m_index * 0x11111111U + 0x8765U);
        }
    }

    bool isUntouched() const {
        return std::all_of(m_memory.begin(), m_memory.end(), [](const Block& block) {
            return std::all_of(block.begin(), block.end(),
                               [](unsigned char byte) { return byte == untouchedByte; });
        });
    }

private:
    static constexpr unsigned char untouchedByte = 0xA5;
    static constexpr uint32_t blockSize = 16;
    static constexpr std::array texts{"zero", "one", "two", "three", "four", "five", "six", "seven", "eight"};
    struct alignas(16) Block : std::array<unsigned char, blockSize> {};

    std::array<Block, texts.size()> m_memory;
    uint32_t m_index = 0;
    bool m_lastWasBytes = false;
};

template <class Function>
struct CallSignature;
template <class... Arguments>
struct CallSignature<TELIX_RETCODE_ENUM_T (*)(Arguments...)> {
    using ArgumentTuple = std::tuple<Arguments...>;
    static ArgumentTuple sample(ArgumentSource& source) { return ArgumentTuple{source.next<Arguments>()...}; }
};

// The names of all calls in the order of the list, with and without the one that is never bound.
inline std::vector<std::string> callNames() {
    return {
#define TELIX_CALL(name, parameters, arguments) #name,
#include "telix/telix_platform_calls.h"
    };
}
inline std::vector<std::string> boundCallNames() {
    return {
#define TELIX_CALL(name, parameters, arguments) #name,
#define TELIX_CALL_UNBOUND(name, parameters, arguments)
#include "telix/telix_platform_calls.h"
    };
}

#endif
