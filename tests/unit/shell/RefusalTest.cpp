// What each wrapper class logs when it refuses a name: some operations of a class speak, others are silent.
#include "src/application/JSApplication.h"
#include "src/application/JSApplicationPrivateData.h"
#include "src/avcomponent/JSAVcomponent.h"
#include "src/avcomponent/JSAVcomponentList.h"
#include "src/channel/JSChannel.h"
#include "src/channel/JSChannelConfig.h"
#include "src/channel/JSChannelList.h"
#include "src/config/JSConfiguration.h"
#include "src/config/JSKeySet.h"
#include "src/parental/JSParentalRating.h"
#include "src/parental/JSParentalRatingCollection.h"
#include "src/parental/JSParentalRatingScheme.h"
#include "src/parental/JSParentalRatingSchemeCollection.h"
#include "src/programme/JSProgramme.h"
#include "src/programme/JSProgrammeCollection.h"
#include "tests/support/SubObjectTest.h"

namespace {

enum Operation : unsigned {
    Silent = 0,
    HasMethod = 1,
    Invoke = 2,
    SetProperty = 4,
    Methods = HasMethod | Invoke
};

class RefusalTest : public SubObjectTest {
protected:
    // All that the three operations print for a name that no class has.
    std::string refusalsOf(const ObjectRef& object) {
        return logOf(1, [&object] {
            const NPIdentifier unknown = Name("unknown").identifier();
            const ArgumentArray value({1});
            NPVariant result{};
            EXPECT_FALSE(JSPluginBase::_HasMethod(object.object(), unknown));
            EXPECT_FALSE(JSPluginBase::_Invoke(object.object(), unknown, value.data(), 1, &result));
            EXPECT_FALSE(JSPluginBase::_SetProperty(object.object(), unknown, value.data()));
        });
    }

    static std::string linesOf(const char* module, const std::string& className, unsigned speaking) {
        std::string lines;
        for (const auto& [operation, name] : {std::pair(HasMethod, "HasMethod"), std::pair(Invoke, "Invoke"),
                                              std::pair(SetProperty, "SetProperty")}) {
            if (speaking & operation) {
                lines += logLine(module, name, className + " class\n");
            }
        }
        return lines;
    }

    template <class Wrapper>
    void expectSubObject(const char* module, const char* className, unsigned speaking) {
        const ObjectRef object = make<Wrapper>();
        EXPECT_EQ(refusalsOf(object), linesOf(module, className, speaking)) << className;
    }

    void expectEmbedded(const char* mimeType, const char* module, const char* className, unsigned speaking) {
        const EmbeddedObject embedded = browser.embed(mimeType, {{"id", "element"}});
        EXPECT_EQ(refusalsOf(embedded.scriptObject()), linesOf(module, className, speaking)) << className;
    }
};

TEST_F(RefusalTest, ApplicationsSpeakOfWritesToThePrivateDataAlone) {
    expectEmbedded("application/oipfapplicationmanager", "APP_MGR", "JSApplicationManager", Silent);
    expectSubObject<JSApplication>("APP_MGR", "JSApplication", Silent);
    expectSubObject<JSApplicationPrivateData>("APP_MGR", "JSApplicationPrivateData", SetProperty);
}

TEST_F(RefusalTest, ChannelsSpeakOfEverythingTheirListOfNothing) {
    expectSubObject<JSChannel>("CHANNEL", "JSChannel", Methods | SetProperty);
    expectSubObject<JSChannelConfig>("CHANNEL", "JSChannelConfig", Methods | SetProperty);
    expectSubObject<JSChannelList>("CHANNEL", "JSChannelList", Silent);
}

TEST_F(RefusalTest, ProgrammesSpeakOfMethods) {
    expectSubObject<JSProgramme>("PROGRAMME", "JSProgramme", Methods);
    expectSubObject<JSProgrammeCollection>("PROGRAMME", "JSProgrammeCollection", Silent);
}

TEST_F(RefusalTest, ComponentListsSpeakOfWrites) {
    expectSubObject<JSAVcomponent>("AV_COMP", "JSAVcomponent", Silent);
    expectSubObject<JSAVcomponentList>("AV_COMP", "JSAVcomponentList", SetProperty);
}

TEST_F(RefusalTest, ParentalControlSpeaksOfRatings) {
    expectSubObject<JSParentalRating>("PARENTAL", "JSParentalRating", Methods | SetProperty);
    expectSubObject<JSParentalRatingCollection>("PARENTAL", "JSParentalRatingCollection", SetProperty);
    expectSubObject<JSParentalRatingScheme>("PARENTAL", "JSParentalRatingScheme", Silent);
    expectSubObject<JSParentalRatingSchemeCollection>("PARENTAL", "JSParentalRatingSchemeCollection", Silent);
    expectEmbedded("application/oipfparentalcontrolmanager", "PARENTAL", "JSParentalControlManager", Silent);
}

TEST_F(RefusalTest, ConfigurationsSpeakOfMethods) {
    expectEmbedded("application/oipfconfiguration", "CONFIG", "JSOipfConfiguration", Methods);
    expectSubObject<JSConfiguration>("CONFIG", "JSConfiguration", Silent);
    expectSubObject<JSKeySet>("APP_MGR", "JSKeySet", Silent);
}

TEST_F(RefusalTest, TheOtherEmbeddedObjectsAreSilent) {
    expectEmbedded("application/oipfcapabilities", "CAPABILITIES", "JSCapabilities", Silent);
    expectEmbedded("application/oipfdrmagent", "DRMAGENT", "JSDRMAgent", Silent);
    expectEmbedded("video/mp4", "AVCONTROL", "JSAVControl", Silent);
    expectEmbedded("video/broadcast", "VIDEOBCAST", "JSVideoBroadcast", Silent);
}

} // namespace
