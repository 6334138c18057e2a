// The processes that the engine has started.
#ifndef TELIX_DESKTOP_WINDOW_WEBKIT_CHILDPROCESSES_H
#define TELIX_DESKTOP_WINDOW_WEBKIT_CHILDPROCESSES_H

namespace desktop {

// Ends all child processes of this process and waits until they have ended. The engine ends its own only when
// this process ends, and they write to the profile until then.
void endChildProcesses();

} // namespace desktop

#endif
