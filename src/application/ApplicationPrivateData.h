// The model behind an application's private data: its key set, the device's free memory and the channel that
// is presented. Browser thread only.
#ifndef TELIX_SRC_APPLICATION_APPLICATIONPRIVATEDATA_H
#define TELIX_SRC_APPLICATION_APPLICATIONPRIVATEDATA_H

#include "common/PluginBase.h"

class ApplicationPrivateData final : public PluginBase {
public:
    explicit ApplicationPrivateData(NPP npp);
    ~ApplicationPrivateData();

    // Made at the first use. The caller owns one reference; null if the browser refuses to make it.
    NPObject* keySet();

    // In the platform's unit; the last figure if the platform refuses or no live application owns this
    // object.
    uint32_t getFreeMem();

    // The channel that the platform presents: the same object as long as its handle stays the same. The
    // caller owns one reference, but not of what is given when the platform refuses: that is the last object,
    // or null.
    NPObject* getCurrChannel();

private:
    NPObject* m_keySet = nullptr; // one reference held
    uint32_t m_freeMem = 0;
    NPObject* m_currentChannel = nullptr; // one reference held, never released at the end
};

#endif
