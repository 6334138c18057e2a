// The browser's calls into one instance.
#include "tests/support/EmbeddedObject.h"

#include <gtest/gtest.h>

#include "tests/support/ScriptedBrowser.h"

namespace {

NPPluginFuncs& plugin() {
    return ScriptedBrowser::current().plugin();
}

} // namespace

BrowserStream::BrowserStream(NPP npp, const std::string& url, const std::string& headers, void* notifyData)
    : m_npp(npp), m_url(url), m_headers(headers) {
    m_stream.url = m_url.c_str();
    m_stream.headers = m_headers.c_str();
    m_stream.notifyData = notifyData;
}

NPError BrowserStream::offer(const std::string& type, bool seekable) {
    std::string mutableType = type;
    m_error = plugin().newstream(m_npp, mutableType.data(), &m_stream, seekable, &m_mode);
    return m_error;
}

int32_t BrowserStream::writeReady() {
    return plugin().writeready(m_npp, &m_stream);
}

int32_t BrowserStream::write(const std::string& bytes) {
    const int32_t written = writeAt(m_offset, bytes);
    m_offset += static_cast<int32_t>(bytes.size());
    return written;
}

int32_t BrowserStream::writeAt(int32_t offset, const std::string& bytes) {
    std::string buffer = bytes;
    return plugin().write(m_npp, &m_stream, offset, static_cast<int32_t>(bytes.size()), buffer.data());
}

NPError BrowserStream::destroy(NPReason reason) {
    return plugin().destroystream(m_npp, &m_stream, reason);
}

ObjectRef EmbeddedObject::scriptObject() const {
    if (!m_record->scriptObject) {
        NPObject* object = nullptr;
        if (plugin().getvalue(npp(), NPPVpluginScriptableNPObject, &object) != NPERR_NO_ERROR || !object) {
            ADD_FAILURE() << "The plug-in gave no scriptable object.";
            return {};
        }
        m_record->scriptObject = ObjectRef::adopt(object);
    }
    return m_record->scriptObject;
}

void EmbeddedObject::setRectangle(double left, double top, double right, double bottom) const {
    element().method("getBoundingClientRect", [=](const Values&) {
        const ScriptObject rectangle = ScriptObject::make("rectangle");
        rectangle.set("left", left);
        rectangle.set("top", top);
        rectangle.set("right", right);
        rectangle.set("bottom", bottom);
        return Value(rectangle);
    });
}

NPError EmbeddedObject::setWindow(int32_t x, int32_t y, uint32_t width, uint32_t height) const {
    NPWindow window{};
    window.x = x;
    window.y = y;
    window.width = width;
    window.height = height;
    window.type = NPWindowTypeDrawable;
    return plugin().setwindow(npp(), &window);
}

NPError EmbeddedObject::setNullWindow() const {
    return plugin().setwindow(npp(), nullptr);
}

int16_t EmbeddedObject::handleEvent(void* event) const {
    return plugin().event(npp(), event);
}

BrowserStream& EmbeddedObject::newStream(const std::string& url, const std::string& headers,
                                         const std::string& type, void* notifyData) const {
    BrowserStream& stream = m_record->streams.emplace_back(npp(), url, headers, notifyData);
    stream.offer(type, false);
    return stream;
}

void EmbeddedObject::urlNotify(const std::string& url, NPReason reason, void* notifyData) const {
    plugin().urlnotify(npp(), url.c_str(), reason, notifyData);
}

NPError EmbeddedObject::destroy() const {
    m_record->destroyed = true;
    NPSavedData* saved = nullptr;
    return plugin().destroy(npp(), &saved);
}
