// Repeats tables into a stream that is played out.
#ifndef TELIX_DESKTOP_PLATFORM_TABLEINJECTOR_H
#define TELIX_DESKTOP_PLATFORM_TABLEINJECTOR_H

#include <set>

#include "desktop/platform/Clock.h"
#include "desktop/platform/TsTables.h"

namespace desktop {

// Playout thread.
class TableInjector {
public:
    virtual ~TableInjector() = default;

    // Appends the packets of the tables whose repetition interval has passed since they were last sent.
    virtual void appendDue(Clock::Instant now, int64_t utcSeconds, Bytes& packets) = 0;

    // The PIDs of the file that are played out. The tables replace all others.
    virtual const std::set<uint16_t>& passedPids() const = 0;
};

} // namespace desktop

#endif
