// The place of an embedded object on the screen, as the media objects present it: read from the element's
// rectangle in the page, the whole screen in full screen, and given to the platform when it has changed.
// Browser thread only.
#ifndef TELIX_COMMON_DISPLAYAREA_H
#define TELIX_COMMON_DISPLAYAREA_H

#include <cstdint>

#include "common/BrowserGates.h"
#include "common/PluginBase.h"

// In pixels of the screen.
struct Area {
    int32_t x = 0;
    int32_t y = 0;
    int32_t width = 0;
    int32_t height = 0;

    bool operator==(const Area& other) const {
        return x == other.x && y == other.y && width == other.width && height == other.height;
    }
};

class DisplayArea {
public:
    // The element's rectangle as last read. Not constant: script may overwrite the sizes of one kind of
    // object until the next reading.
    Area& region() { return m_region; }
    const Area& region() const { return m_region; }

    // Reads the rectangle of the model's element. What the page doesn't give stays as it was; so does the
    // whole region if the page gives something else than an object. The model outlives this call.
    void readRegion(PluginBase& model);

    // The area to present: the whole screen in full screen, else the region, which is read once more if it is
    // empty. If that second reading is as large as the screen, it is moved to the origin.
    Area choose(PluginBase& model, bool isFullScreen);

    // Whether the platform has accepted exactly this area last.
    bool isAccepted(const Area& area) const { return area == m_accepted; }

    // Invalidates the area in the browser, then gives it to the platform with `set(handle, record)`, each
    // value cut to the record's 16 bits. False if the platform refuses: the area then isn't the accepted one,
    // so that the next attempt is made again.
    template <class Result, class Handle, class Record>
    bool present(NPP npp, const Area& area, Handle handle, Result (*set)(Handle, const Record*)) {
        invalidate(npp, area);
        const Record record{static_cast<uint16_t>(area.x), static_cast<uint16_t>(area.y),
                            static_cast<uint16_t>(area.width), static_cast<uint16_t>(area.height)};
        if (set(handle, &record) != 0) {
            return false;
        }
        m_accepted = area;
        return true;
    }

private:
    static void invalidate(NPP npp, const Area& area);

    Area m_region;
    Area m_accepted;
};

#endif
