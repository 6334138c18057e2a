// What tools/mutate.py writes into the sources that it compiles: all mutants of a build are in it, numbered,
// and off. The environment turns one on.
#ifndef TELIX_TESTS_MUTATION_MUTANT_H
#define TELIX_TESTS_MUTATION_MUTANT_H

#include <cstddef>

namespace telix_mutation {

// Whether mutant `number` is the one that TELIX_MUTANT names. Notes that the place of the mutant was reached.
// Any thread, at any time, before main as well.
bool isOn(int number);

// Which mutants were reached since the last call of forgetReached: a byte for each, not 0 if it was.
constexpr size_t kMaxMutants = 65536;
const unsigned char* reached();
void forgetReached();

// The operator of each function, or the mutant's one. Its operands are evaluated once, as those of the
// operator are.
#define TELIX_MUTATED_OPERATOR(name, original, mutated)                                                      \
    template <class A, class B>                                                                              \
    auto name(int number, const A& a, const B& b) {                                                          \
        return isOn(number) ? (a mutated b) : (a original b);                                                \
    }
TELIX_MUTATED_OPERATOR(less, <, <=)
TELIX_MUTATED_OPERATOR(lessOrEqual, <=, <)
TELIX_MUTATED_OPERATOR(greater, >, >=)
TELIX_MUTATED_OPERATOR(greaterOrEqual, >=, >)
TELIX_MUTATED_OPERATOR(equal, ==, !=)
TELIX_MUTATED_OPERATOR(notEqual, !=, ==)
TELIX_MUTATED_OPERATOR(plus, +, -)
TELIX_MUTATED_OPERATOR(minus, -, +)
TELIX_MUTATED_OPERATOR(times, *, /)
TELIX_MUTATED_OPERATOR(dividedBy, /, *)
TELIX_MUTATED_OPERATOR(modulo, %, *)
TELIX_MUTATED_OPERATOR(bitAnd, &, |)
TELIX_MUTATED_OPERATOR(bitOr, |, &)
TELIX_MUTATED_OPERATOR(shiftLeft, <<, >>)
TELIX_MUTATED_OPERATOR(shiftRight, >>, <<)
#undef TELIX_MUTATED_OPERATOR

} // namespace telix_mutation

#endif
