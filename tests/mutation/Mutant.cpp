// TELIX_MUTANT: the number of the mutant that is on; none without it.
// TELIX_MUTANTS_REACHED: the file, of kMaxMutants bytes, that notes which mutants are reached, of every
// process that has it.
#include "tests/mutation/Mutant.h"

#include <fcntl.h>
#include <sys/mman.h>
#include <unistd.h>

#include <cstdlib>
#include <cstring>

namespace telix_mutation {
namespace {

struct State {
    State() {
        if (const char* number = getenv("TELIX_MUTANT")) {
            m_mutant = atoi(number);
        }
        const char* file = getenv("TELIX_MUTANTS_REACHED");
        const int descriptor = file ? open(file, O_RDWR | O_CLOEXEC) : -1;
        // Shared with the processes that a test forks, with a file or without.
        void* memory = mmap(nullptr, kMaxMutants, PROT_READ | PROT_WRITE,
                            descriptor < 0 ? MAP_SHARED | MAP_ANONYMOUS : MAP_SHARED, descriptor, 0);
        if (descriptor >= 0) {
            close(descriptor);
        }
        if (memory == MAP_FAILED) {
            abort();
        }
        m_reached = static_cast<unsigned char*>(memory);
    }

    int m_mutant = -1;
    unsigned char* m_reached = nullptr;
};

State& state() {
    static State state;
    return state;
}

// Before the constructors of the sources and before a test changes the environment.
__attribute__((constructor(101))) void readEnvironment() {
    state();
}

} // namespace

bool isOn(int number) {
    state().m_reached[number] = 1;
    return state().m_mutant == number;
}

const unsigned char* reached() {
    return state().m_reached;
}

void forgetReached() {
    memset(state().m_reached, 0, kMaxMutants);
}

} // namespace telix_mutation
