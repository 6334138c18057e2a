// Whether the plug-in is on the stack. While it is, nothing that it may be using is ended or deleted: pages
// end their instances then from the main loop. Main thread only.
#ifndef TELIX_BRIDGE_CALLDEPTH_H
#define TELIX_BRIDGE_CALLDEPTH_H

namespace bridge {

// Lives during each call of the bridge into the plug-in, and during each call of the plug-in that runs
// script.
class CallDepth {
public:
    CallDepth() { pluginDepth++; }
    CallDepth(const CallDepth&) = delete;
    CallDepth& operator=(const CallDepth&) = delete;
    ~CallDepth() { pluginDepth--; }

    static bool isPluginOnStack() { return pluginDepth > 0; }

    // Lives during a call that looks like one into the plug-in and is one of the bridge's own objects.
    class Own {
    public:
        Own() { pluginDepth--; }
        Own(const Own&) = delete;
        Own& operator=(const Own&) = delete;
        ~Own() { pluginDepth++; }
    };

private:
    static inline int pluginDepth = 0;
};

} // namespace bridge

#endif
