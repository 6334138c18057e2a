// Prints the tables of all script interfaces as JSON: what the reference for authors of pages is made from
// and checked against. The wrappers are made without a browser and without a platform library, since their
// tables need neither.
#include <cstdio>
#include <string>

#include "common/BrowserGates.h"
#include "common/ObjectKind.h"
#include "common/ScriptWrapper.h"
#include "src/application/ApplicationManager.h"
#include "src/application/JSApplication.h"
#include "src/application/JSApplicationManager.h"
#include "src/application/JSApplicationPrivateData.h"
#include "src/avcomponent/JSAVcomponent.h"
#include "src/avcomponent/JSAVcomponentList.h"
#include "src/avcontrol/AVControl.h"
#include "src/avcontrol/JSAVControl.h"
#include "src/capabilities/Capabilities.h"
#include "src/capabilities/JSCapabilities.h"
#include "src/channel/JSChannel.h"
#include "src/channel/JSChannelConfig.h"
#include "src/channel/JSChannelList.h"
#include "src/config/JSConfiguration.h"
#include "src/config/JSKeySet.h"
#include "src/config/JSOipfConfiguration.h"
#include "src/config/OipfConfiguration.h"
#include "src/drm/DRMAgent.h"
#include "src/drm/JSDRMAgent.h"
#include "src/parental/JSParentalControlManager.h"
#include "src/parental/JSParentalRating.h"
#include "src/parental/JSParentalRatingCollection.h"
#include "src/parental/JSParentalRatingScheme.h"
#include "src/parental/JSParentalRatingSchemeCollection.h"
#include "src/parental/ParentalControlManager.h"
#include "src/programme/JSProgramme.h"
#include "src/programme/JSProgrammeCollection.h"
#include "src/videobroadcast/JSVideoBroadcast.h"
#include "src/videobroadcast/VideoBroadcast.h"

namespace {

// No string of the tables needs an escape: they are names of script and MIME types.
std::string quoted(const std::string& text) {
    return '"' + text + '"';
}

// `items` one after the other, as a JSON array.
class Array {
public:
    void add(const std::string& item) { m_text += (m_text.empty() ? "" : ",") + item; }
    std::string text() const { return "[" + m_text + "]"; }

private:
    std::string m_text;
};

const char* nameOf(ScriptType type) {
    switch (type) {
    case ScriptType::Nothing:
        return "void";
    case ScriptType::Boolean:
        return "boolean";
    case ScriptType::Number:
        return "number";
    case ScriptType::String:
        return "string";
    case ScriptType::Object:
        return "object";
    case ScriptType::Unstated:
        break;
    }
    return "unstated";
}

std::string describe(const ScriptMember& member) {
    Array arguments;
    for (const ScriptType type : member.types.arguments) {
        if (type == ScriptType::Unstated) {
            break;
        }
        arguments.add(quoted(nameOf(type)));
    }
    std::string text = "{\"name\":" + quoted(member.name) +
                       ",\"result\":" + quoted(nameOf(member.types.result)) +
                       ",\"arguments\":" + arguments.text() + ",\"kind\":";
    if (member.isMethod()) {
        return text + "\"method\"}";
    }
    if (!member.read) {
        return text + "\"constant\",\"value\":" + std::to_string(member.constantValue) + "}";
    }
    return text + "\"property\",\"writable\":" + (member.write ? "true" : "false") + "}";
}

// A wrapper class; `kind` if pages embed it.
template <class Wrapper>
std::string describe(const ObjectKind* kind = nullptr) {
    NPP_t instance{};
    const Wrapper wrapper(&instance);
    const ScriptClass& scriptClass = wrapper.scriptClass();
    Array mimeTypes;
    for (const char* const* type = kind ? kind->mimeTypes : nullptr; type && *type; ++type) {
        mimeTypes.add(quoted(*type));
    }
    Array members;
    for (size_t index = 0; index < scriptClass.memberCount; ++index) {
        members.add(describe(scriptClass.members[index]));
    }
    return "{\"class\":" + quoted(scriptClass.name) + ",\"mimeTypes\":" + mimeTypes.text() +
           ",\"isArray\":" + (scriptClass.array ? "true" : "false") + ",\"members\":" + members.text() + "}";
}

std::string describeAll() {
    Array classes;
    classes.add(describe<JSApplicationManager>(&kApplicationManagerKind));
    classes.add(describe<JSApplication>());
    classes.add(describe<JSApplicationPrivateData>());
    classes.add(describe<JSKeySet>());
    classes.add(describe<JSVideoBroadcast>(&kVideoBroadcastKind));
    classes.add(describe<JSChannelConfig>());
    classes.add(describe<JSChannelList>());
    classes.add(describe<JSChannel>());
    classes.add(describe<JSProgrammeCollection>());
    classes.add(describe<JSProgramme>());
    classes.add(describe<JSAVControl>(&kAvControlKind));
    classes.add(describe<JSAVcomponentList>());
    classes.add(describe<JSAVcomponent>());
    classes.add(describe<JSOipfConfiguration>(&kOipfConfigurationKind));
    classes.add(describe<JSConfiguration>());
    classes.add(describe<JSCapabilities>(&kCapabilitiesKind));
    classes.add(describe<JSParentalControlManager>(&kParentalControlManagerKind));
    classes.add(describe<JSParentalRatingSchemeCollection>());
    classes.add(describe<JSParentalRatingScheme>());
    classes.add(describe<JSParentalRatingCollection>());
    classes.add(describe<JSParentalRating>());
    classes.add(describe<JSDRMAgent>(&kDrmAgentKind));
    return classes.text();
}

} // namespace

int main() {
    // A browser whose table is empty: names have no identifiers.
    NPNetscapeFuncs browser{};
    NPNFuncs = &browser;
    std::printf("%s\n", describeAll().c_str());
    return 0;
}
