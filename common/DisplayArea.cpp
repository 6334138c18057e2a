// Reading the element's rectangle, and the rules of the area that is presented.
#include "common/DisplayArea.h"

#include "common/PluginUtils.h"

namespace {

// quirk 62: full screen is this size whatever the screen.
constexpr int32_t kScreenWidth = 1280;
constexpr int32_t kScreenHeight = 720;

// From one edge to the other. Wraps around: a page may give any numbers.
int32_t distance(int32_t from, int32_t to) {
    return static_cast<int32_t>(static_cast<uint32_t>(to) - static_cast<uint32_t>(from));
}

uint16_t farEdge(int32_t nearEdge, int32_t size) {
    return static_cast<uint16_t>(static_cast<uint32_t>(nearEdge) + static_cast<uint32_t>(size));
}

} // namespace

void DisplayArea::readRegion(PluginBase& model) {
    const NPP npp = model.getBrowser();
    NPVariant rectangle{};
    if (!NPN_Invoke(npp, model.getNPPluginObj(), NPN_GetStringIdentifier("getBoundingClientRect"), nullptr, 0,
                    &rectangle)) {
        return;
    }
    if (rectangle.type == NPVariantType_Object) {
        // An edge that can't be read leaves what depends on it as it was.
        const auto readEdge = [npp, &rectangle](const char* name, int32_t& value, int32_t origin) {
            NPVariant edge{};
            if (NPN_GetProperty(npp, rectangle.value.objectValue, NPN_GetStringIdentifier(name), &edge)) {
                value = distance(origin, toInt32(numberValue(edge)));
                NPN_ReleaseVariantValue(&edge);
            }
        };
        readEdge("left", m_region.x, 0);
        readEdge("top", m_region.y, 0);
        readEdge("right", m_region.width, m_region.x);
        readEdge("bottom", m_region.height, m_region.y);
    }
    NPN_ReleaseVariantValue(&rectangle);
}

Area DisplayArea::choose(PluginBase& model, bool isFullScreen) {
    // The picture of a television has this size, whatever the screen.
    Area area = isFullScreen ? Area{0, 0, kScreenWidth, kScreenHeight} : m_region;
    if (area == Area{}) {
        readRegion(model);
        area = m_region;
        if (area.width == kScreenWidth && area.height == kScreenHeight) {
            area.x = 0;
            area.y = 0;
        }
    }
    return area;
}

void DisplayArea::invalidate(NPP npp, const Area& area) {
    NPRect stale{};
    stale.top = static_cast<uint16_t>(area.y);
    stale.left = static_cast<uint16_t>(area.x);
    stale.bottom = farEdge(area.y, area.height);
    stale.right = farEdge(area.x, area.width);
    NPN_InvalidateRect(npp, &stale);
}
