// One `object` element of the page with its plug-in instance: made, asked and destroyed as a browser does it.
#ifndef TELIX_TESTS_SUPPORT_EMBEDDEDOBJECT_H
#define TELIX_TESTS_SUPPORT_EMBEDDEDOBJECT_H

#include <deque>
#include <memory>
#include <string>
#include <utility>
#include <vector>

#include "npapi/npfunctions.h"
#include "tests/support/PageObjects.h"
#include "tests/support/Value.h"

using Attributes = std::vector<std::pair<std::string, std::string>>;

// A stream that the browser offers to an instance. Lives as long as the instance's record.
class BrowserStream {
public:
    BrowserStream(NPP npp, const std::string& url, const std::string& headers, void* notifyData);
    BrowserStream(const BrowserStream&) = delete;
    BrowserStream& operator=(const BrowserStream&) = delete;

    NPError offer(const std::string& type, bool seekable);
    NPError error() const { return m_error; } // what NPP_NewStream said
    uint16_t mode() const { return m_mode; }  // the stream mode that the instance chose
    int32_t writeReady();
    // NPP_Write with the next bytes of the stream, zeros after them in memory; or at another offset.
    int32_t write(const std::string& bytes);
    int32_t writeAt(int32_t offset, const std::string& bytes);
    // NPP_DestroyStream.
    NPError destroy(NPReason reason = NPRES_DONE);
    // Whether the plug-in called NPN_DestroyStream on it.
    bool wasDestroyedByPlugin() const { return m_destroyedByPlugin; }
    NPStream& record() { return m_stream; }

private:
    friend struct BrowserTable;

    NPP m_npp;
    std::string m_url;
    std::string m_headers;
    NPStream m_stream{};
    NPError m_error = NPERR_NO_ERROR;
    uint16_t m_mode = NP_NORMAL;
    int32_t m_offset = 0;
    bool m_destroyedByPlugin = false;
};

// A handle; copies share the instance. The browser destroys at the end what the test didn't.
class EmbeddedObject {
public:
    // What NPP_New said.
    NPError error() const { return m_record->error; }
    NPP npp() const { return &m_record->npp; }
    // The model that the plug-in keeps in the instance, null before and after its life.
    void* model() const { return m_record->npp.pdata; }
    ScriptObject element() const { return m_record->element; }
    // The scriptable object, asked of the plug-in when first needed and kept by the page until the end of the
    // test or dropScriptObject().
    ObjectRef scriptObject() const;
    void dropScriptObject() const { m_record->scriptObject = ObjectRef(); }

    Outcome get(const Name& name) const { return scriptObject().get(name); }
    Outcome set(const Name& name, const Value& value) const { return scriptObject().set(name, value); }
    template <class... Arguments>
    Outcome call(const Name& name, const Arguments&... arguments) const {
        return scriptObject().call(name, arguments...);
    }
    bool hasProperty(const Name& name) const { return scriptObject().hasProperty(name); }
    bool hasMethod(const Name& name) const { return scriptObject().hasMethod(name); }

    // What element.getBoundingClientRect() gives from now on. Zero throughout at first.
    void setRectangle(double left, double top, double right, double bottom) const;

    // NPP_SetWindow with a windowless record of this place, or with null.
    NPError setWindow(int32_t x, int32_t y, uint32_t width, uint32_t height) const;
    NPError setNullWindow() const;
    int16_t handleEvent(void* event = nullptr) const;
    // NPP_NewStream.
    BrowserStream& newStream(const std::string& url, const std::string& headers = "",
                             const std::string& type = "", void* notifyData = nullptr) const;
    void urlNotify(const std::string& url, NPReason reason, void* notifyData = nullptr) const;
    // NPP_Destroy. The page keeps its references.
    NPError destroy() const;
    bool isDestroyed() const { return m_record->destroyed; }

private:
    friend class ScriptedBrowser;
    friend struct BrowserTable;

    struct Record {
        NPP_t npp{};
        std::string id;
        ScriptObject element;
        ObjectRef scriptObject;
        std::deque<BrowserStream> streams;
        NPError error = NPERR_NO_ERROR;
        bool destroyed = false;
    };

    explicit EmbeddedObject(std::shared_ptr<Record> record) : m_record(std::move(record)) {}

    std::shared_ptr<Record> m_record;
};

#endif
