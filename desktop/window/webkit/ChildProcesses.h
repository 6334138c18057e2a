// The processes that the engine has started.
#ifndef TELIX_DESKTOP_WINDOW_WEBKIT_CHILDPROCESSES_H
#define TELIX_DESKTOP_WINDOW_WEBKIT_CHILDPROCESSES_H

namespace desktop {

// Ends all child processes of this process, which write to the profile until then: those that have not ended
// by themselves after the time in milliseconds are killed. Returns when all have ended.
void endChildProcesses(unsigned timeoutMs);

} // namespace desktop

#endif
