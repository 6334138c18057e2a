// The scripts that the plug-in has the page evaluate, byte for byte.
#include "common/PluginUtils.h"

#include <algorithm>
#include <fstream>
#include <iterator>

#include "tests/support/BorderTest.h"

using ::testing::AllOf;
using ::testing::HasSubstr;
using ::testing::Not;
using ::testing::StartsWith;

namespace {

using PageScriptsTest = BorderTest;

// A script byte for byte, as a file of the folder `scripts` holds it. A script is one line; its file ends
// where the script ends, without a line end.
void expectBytesOf(const char* file, const std::string& script) {
    std::ifstream stream(std::string(TELIX_UNIT_TESTS "/shell/scripts/") + file, std::ios::binary);
    ASSERT_TRUE(stream) << file;
    const std::string expected{std::istreambuf_iterator<char>(stream), std::istreambuf_iterator<char>()};
    const auto [here, there] = std::mismatch(expected.begin(), expected.end(), script.begin(), script.end());
    if (here == expected.end() && there == script.end()) {
        return;
    }
    const auto place = static_cast<size_t>(here - expected.begin());
    const size_t from = place < 20 ? 0 : place - 20;
    ADD_FAILURE() << file << ": byte " << place
                  << " is the first that differs\n  expected: " << Value(expected.substr(from, 60))
                  << "\n  but is:   " << Value(script.substr(from, 60));
}

TEST_F(PageScriptsTest, EveryByteOfAScriptIsWhatPagesRelyOn) {
    expectBytesOf("domEventScript.txt", domEventScript("tv", "PlayStateChange", true, false));
    expectBytesOf("streamEventScript.txt", streamEventScript("name", "41420A", "trigger", "tv"));
    expectBytesOf("streamEventScript.withoutText.txt", streamEventScript("name", "", "error", "tv"));
    expectBytesOf("parseStreamEventXMLScript.add.txt",
                  parseStreamEventXMLScript("dvb://1", "name", "tv", true));
    expectBytesOf("parseStreamEventXMLScript.remove.txt",
                  parseStreamEventXMLScript("dvb://1", "name", "tv", false));
    expectBytesOf("getPlayCountVal.txt", getPlayCountVal("player"));
    expectBytesOf("getEncodedURL.txt", getEncodedURL("http://a.example/b c"));
}

TEST_F(PageScriptsTest, AnArgumentThatLooksLikeAPlaceStaysAnArgument) {
    EXPECT_THAT(parseStreamEventXMLScript("@@", "@\n@", "i@@", true),
                AllOf(StartsWith("var requestURL = '@@'; var eventName = '@\n@';var httpReq"),
                      HasSubstr("document.getElementById('i@@');objElem.addStreamEventListener(")));
}

TEST_F(PageScriptsTest, ADomEventIsDispatchedAtTheElement) {
    EXPECT_EQ(domEventScript("a", "b", true, false),
              "var objElement=document.getElementById(\"a\"); newEvent=document.createEvent(\"Event\");"
              "newEvent.initEvent(\"b\", true,false); objElement.dispatchEvent(newEvent);");
    EXPECT_THAT(domEventScript("a", "b", false, true), HasSubstr("newEvent.initEvent(\"b\", false,true);"));
    EXPECT_THAT(domEventScript("a", "b", true, true), HasSubstr("newEvent.initEvent(\"b\", true,true);"));
    EXPECT_THAT(domEventScript("a", "b", false, false), HasSubstr("newEvent.initEvent(\"b\", false,false);"));
}

TEST_F(PageScriptsTest, ADomEventNeedsElementAndName) {
    EXPECT_DEATH(domEventScript("", "b", false, false), "common/PluginUtils.*!id.empty\\(\\)");
    EXPECT_DEATH(domEventScript("a", "", false, false), "common/PluginUtils.*!event.empty\\(\\)");
    EXPECT_DEATH(domEventScript("", "", false, false), "!id.empty\\(\\)");
}

TEST_F(PageScriptsTest, ArgumentsGoInUnescaped) {
    EXPECT_THAT(domEventScript("a\"b", "c'\\d", false, false),
                StartsWith("var objElement=document.getElementById(\"a\"b\"); "));
    EXPECT_THAT(domEventScript("a", "c'\\d", false, false), HasSubstr("initEvent(\"c'\\d\", "));
    EXPECT_THAT(getEncodedURL("a\"b"), HasSubstr("encodeURI(\"a\"b\");"));
}

TEST_F(PageScriptsTest, AStreamEventCarriesItsData) {
    EXPECT_EQ(
        streamEventScript("name", "41420A", "trigger", "tv"),
        "var objElement = document.getElementById(\"tv\"); var strEvent = document.createEvent('Event'); "
        "strEvent.initEvent('StreamEvent', false, false); strEvent.name = \"name\"; strEvent.data = "
        "\"41420A\";  strEvent.text = \"AB\\n\";  strEvent.status = \"trigger\"; "
        "objElement.dispatchEvent(strEvent);");
}

TEST_F(PageScriptsTest, AStreamEventWithoutTextLeavesItOut) {
    EXPECT_EQ(
        streamEventScript("name", "", "error", "tv"),
        "var objElement = document.getElementById(\"tv\"); var strEvent = document.createEvent('Event'); "
        "strEvent.initEvent('StreamEvent', false, false); strEvent.name = \"name\"; strEvent.data = \"\";  "
        "strEvent.status = \"error\"; objElement.dispatchEvent(strEvent);");
    EXPECT_THAT(streamEventScript("name", "00", "trigger", "tv"), Not(HasSubstr("strEvent.text")));
}

TEST_F(PageScriptsTest, ControlCharactersHaveEscapes) {
    const char* const kEscapes[] = {"\\a", "\\b", "\\t", "\\n", "\\v", "\\f", "\\r"};
    for (int value = -1; value < 256; ++value) {
        EXPECT_EQ(getEscapeChar(static_cast<ESC_CHAR_ENUM_T>(value)),
                  value >= 7 && value <= 13 ? kEscapes[value - 7] : "")
            << value;
    }
}

TEST_F(PageScriptsTest, HexadecimalDataBecomesText) {
    EXPECT_EQ(parseDataAsUTF8("41420A"), "AB\\n");
    EXPECT_EQ(parseDataAsUTF8("c3A4"), "\xC3\xA4");
    EXPECT_EQ(parseDataAsUTF8("0708090a0b0c0d0e06"), "\\a\\b\\t\\n\\v\\f\\r\x0E\x06");
    EXPECT_EQ(parseDataAsUTF8("22"), "\"");
    EXPECT_EQ(parseDataAsUTF8("ff"), "\xFF");
    EXPECT_EQ(parseDataAsUTF8(""), "");
}

TEST_F(PageScriptsTest, AHalfPairCountsAsAWholeValue) {
    EXPECT_EQ(parseDataAsUTF8("4"), "\x04");
    EXPECT_EQ(parseDataAsUTF8("414"), "A\x04");
    EXPECT_EQ(parseDataAsUTF8("4G"), "\x04");
}

TEST_F(PageScriptsTest, APairWithoutLeadingDigitAndAZeroAddNothing) {
    EXPECT_EQ(parseDataAsUTF8("00"), "");
    EXPECT_EQ(parseDataAsUTF8("410042"), "AB");
    EXPECT_EQ(parseDataAsUTF8("G4"), "");
    EXPECT_EQ(parseDataAsUTF8("41G442"), "AB");
}

// The text of parseStreamEventXMLScript between url and method name.
const std::string kStreamEventScriptBody =
    "var httpReq = new XMLHttpRequest();httpReq.open('GET', requestURL, true);"
    "httpReq.onreadystatechange = function(){\tif((httpReq.readyState == 4) && (httpReq.status == 200)){"
    "\t\tvar eventId_val = null;\t\tvar comp_tag_val = null;\t\tif(xmlData = httpReq.responseXML){"
    "\t\t\tvar stream_event_type_elem =  xmlData.getElementsByTagName('stream_event');"
    "\t\t\tfor(i=0; i < stream_event_type_elem.length; i++){"
    "\t\t\t\tif(stream_event_type_elem[i].getAttribute('stream_event_name') == eventName){"
    "\t\t\t\t\teventId_val = stream_event_type_elem[i].getAttribute('stream_event_id');"
    "\t\t\t\t\tvar stream_event_elem = stream_event_type_elem[i].parentNode;\t\t\t\t\tif(stream_event_elem)"
    "\t\t\t\t\t\tcomp_tag_val = stream_event_elem.getAttribute('component_tag');\t\t\t\t\tbreak;"
    "\t\t\t\t}\t\t\t}\t\t}\t\tif(!eventId_val || !comp_tag_val){\t\t\tif(respText = httpReq.responseText){"
    "\t\t\t\tvar eventset = respText.split(',');\t\t\t\tfor(i=0; i < eventset.length - 1; i++){"
    "\t\t\t\t\teventToken = eventset[i].split('.', 2);\t\t\t\t\tif(eventName == event[1]){"
    "\t\t\t\t\t\teventId_val = event[0];\t\t\t\t\t\tbreak;\t\t\t\t\t}\t\t\t\t}"
    "\t\t\t\tcompToken = eventset[eventset.length - 1];\t\t\t\teventToken = compToken.split('$');"
    "\t\t\t\tcomp_tag_val = eventToken[1];\t\t\t\tif(null == eventId_val){"
    "\t\t\t\t\tevent = eventToken[0].split('.', 2);\t\t\t\t\tif(event[1] == eventName)"
    "\t\t\t\t\t\teventId_val = event[0];\t\t\t\t}\t\t\t}\t\t}";

TEST_F(PageScriptsTest, AStreamEventDescriptionIsFetchedAndHandedToTheElement) {
    EXPECT_EQ(parseStreamEventXMLScript("dvb://1", "name", "tv", true),
              "var requestURL = 'dvb://1'; var eventName = 'name';" + kStreamEventScriptBody +
                  "var objElem = document.getElementById('tv');objElem.addStreamEventListener(requestURL, "
                  "eventName, "
                  "eventId_val, comp_tag_val);}};httpReq.send(null);");
    EXPECT_EQ(parseStreamEventXMLScript("dvb://1", "name", "tv", false),
              "var requestURL = 'dvb://1'; var eventName = 'name';" + kStreamEventScriptBody +
                  "var objElem = document.getElementById('tv');objElem.removeStreamEventListener(requestURL, "
                  "eventName, eventId_val, comp_tag_val);}};httpReq.send(null);");
}

TEST_F(PageScriptsTest, ThePlayCountIsReadFromTheFirstParam) {
    EXPECT_EQ(getPlayCountVal("player"),
              "window.getPlayCountVal = function(){\tvar objElem = document.getElementById(\"player\");"
              "\tvar nodeList = objElem.childNodes;\tfor( var i = 0; i < nodeList.length ; i++)\t{"
              "\t\tvar paramElem = nodeList.item(i);"
              "\t\tif( 'param' == paramElem.nodeName || 'PARAM' == paramElem.nodeName)\t\t{"
              "\t\t\tvar loopStr = paramElem.getAttribute('value');\t\t\treturn loopStr;\t\t}\t}};");
}

TEST_F(PageScriptsTest, AnAddressIsEncodedByThePage) {
    EXPECT_EQ(getEncodedURL("http://a.example/b c"),
              "window.getEncodedURL = function(){\tvar encodedURL = encodeURI(\"http://a.example/b c\");"
              "\treturn encodedURL;};");
}

TEST_F(PageScriptsTest, EveryScriptIsOneLine) {
    for (const std::string& script :
         {domEventScript("a", "b", true, true), streamEventScript("a", "0A0D", "b", "c"),
          parseStreamEventXMLScript("a", "b", "c", true), getPlayCountVal("a"), getEncodedURL("a")}) {
        EXPECT_EQ(script.find_first_of("\r\n"), std::string::npos) << script;
    }
}

TEST_F(PageScriptsTest, ComposingTouchesNothing) {
    domEventScript("a", "b", true, true);
    streamEventScript("a", "41", "b", "c");
    parseStreamEventXMLScript("a", "b", "c", true);
    getPlayCountVal("a");
    getEncodedURL("a");
    EXPECT_TRUE(log.everything().empty());
}

TEST_F(PageScriptsTest, LogsUnderCommon) {
    EXPECT_EQ(logOf(9, [] { domEventScript("a", "b", true, true); }),
              logLine("COMMON", "domEventScript", "Id: a , Event: b \n"));
    EXPECT_EQ(logOf(9, [] { parseDataAsUTF8("41"); }),
              logLine("COMMON", "parseDataAsUTF8", "Data val is: 41 \n"));
    EXPECT_EQ(
        logOf(9, [] { streamEventScript("n", "41", "s", "i"); }),
        logLine("COMMON", "streamEventScript", "is called. Name: n , Data: 41 , Status: s , Id:  i \n") +
            logLine("COMMON", "parseDataAsUTF8", "Data val is: 41 \n") +
            logLine("COMMON", "streamEventScript",
                    "Script: " + streamEventScript("n", "41", "s", "i") + " \n"));
    EXPECT_EQ(logOf(9, [] { parseStreamEventXMLScript("u", "e", "i", true); }),
              logLine("COMMON", "parseStreamEventXMLScript",
                      "Script: " + parseStreamEventXMLScript("u", "e", "i", true) + " \n"));
    EXPECT_EQ(logOf(9, [] { getPlayCountVal("i"); }),
              logLine("COMMON", "getPlayCountVal", "Script:--  " + getPlayCountVal("i") + " ----\n"));
    EXPECT_EQ(logOf(9, [] { getEncodedURL("u"); }),
              logLine("COMMON", "getEncodedURL", "Script:--  " + getEncodedURL("u") + " ----\n"));
}

// With PLUGIN_ESCAPE_EVENTS

class EscapedPageScripts : public BorderTest {
protected:
    EscapedPageScripts() { setenv("PLUGIN_ESCAPE_EVENTS", "1", 1); }
    ~EscapedPageScripts() override { unsetenv("PLUGIN_ESCAPE_EVENTS"); }

    // What a page reads in a literal, by ECMAScript 5.1, section 7.8.4; "unterminated" if it is none.
    static std::string readBack(const std::string& literal) {
        std::string result;
        for (size_t i = 0; i < literal.size(); ++i) {
            const auto c = static_cast<unsigned char>(literal[i]);
            if (c == '"' || c == '\'' || c == '\n' || c == '\r') {
                return "unterminated";
            }
            if (c != '\\') {
                result += static_cast<char>(c);
                continue;
            }
            const char escape = literal.at(++i);
            if (escape == 'x') {
                result += static_cast<char>(std::stoi(literal.substr(i + 1, 2), nullptr, 16));
                i += 2;
            } else if (escape == 'u') {
                const int value = std::stoi(literal.substr(i + 1, 4), nullptr, 16);
                result +=
                    {static_cast<char>(0xE0 | value >> 12), static_cast<char>(0x80 | (value >> 6 & 0x3F)),
                     static_cast<char>(0x80 | (value & 0x3F))};
                i += 4;
            } else {
                result += escape;
            }
        }
        return result;
    }
};

TEST_F(EscapedPageScripts, EveryCharacterIsReadBackAsItWas) {
    std::string all;
    for (int c = 1; c < 128; ++c) {
        all += static_cast<char>(c);
    }
    all += "\xC3\xA4\xE2\x82\xAC\xE2\x80\xA7\xE2\x80\xA8\xE2\x80\xA9\xE2\x80\xAA\xF0\x9F\x93\xBA";
    const std::string literal = literalText(all);
    EXPECT_EQ(readBack(literal), all);
    // Neither line separator stands in the script as it is: they end a literal too.
    EXPECT_THAT(literal, AllOf(HasSubstr("\\u2028\\u2029"), Not(HasSubstr("\xE2\x80\xA8")),
                               Not(HasSubstr("\xE2\x80\xA9"))));
}

TEST_F(EscapedPageScripts, AByteThatIsNotUTF8BecomesAReplacementCharacter) {
    const std::string replacement = "\xEF\xBF\xBD";
    EXPECT_EQ(literalText("a\xFF"
                          "b"),
              "a" + replacement + "b");
    EXPECT_EQ(literalText("\xC3"), replacement);
    EXPECT_EQ(literalText("\x80z"), replacement + "z");
    EXPECT_EQ(literalText("\xC0\x80"), replacement + replacement);                   // overlong
    EXPECT_EQ(literalText("\xED\xA0\x80"), replacement + replacement + replacement); // a surrogate
    EXPECT_EQ(literalText("\xC3\xA4\xC3"), "\xC3\xA4" + replacement);
}

TEST_F(EscapedPageScripts, HoldsInEveryScriptAndForEveryArgument) {
    const std::string quoted = "a\"b'c\\d";
    const std::string escaped = "a\\\"b\\'c\\\\d";
    EXPECT_EQ(domEventScript(quoted, quoted, true, false),
              "var objElement=document.getElementById(\"" + escaped +
                  "\"); newEvent=document.createEvent(\"Event\");newEvent.initEvent(\"" + escaped +
                  "\", true,false); objElement.dispatchEvent(newEvent);");
    EXPECT_EQ(
        streamEventScript(quoted, "22275C0A07E2", quoted, quoted),
        "var objElement = document.getElementById(\"" + escaped +
            "\"); var strEvent = document.createEvent('Event'); "
            "strEvent.initEvent('StreamEvent', false, false); strEvent.name = \"" +
            escaped +
            "\"; strEvent.data = \"22275C0A07E2\";  strEvent.text = \"\\\"\\'\\\\\\x0a\\x07\xEF\xBF\xBD\";  "
            "strEvent.status = \"" +
            escaped + "\"; objElement.dispatchEvent(strEvent);");
    EXPECT_THAT(streamEventScript("n", quoted, "s", "tv"),
                HasSubstr("strEvent.data = \"" + escaped + "\"; "));
    EXPECT_THAT(parseStreamEventXMLScript(quoted, quoted, quoted, true),
                AllOf(StartsWith("var requestURL = '" + escaped + "'; var eventName = '" + escaped + "';"),
                      HasSubstr("document.getElementById('" + escaped + "');")));
    EXPECT_THAT(getPlayCountVal(quoted), HasSubstr("getElementById(\"" + escaped + "\");"));
    EXPECT_THAT(getEncodedURL(quoted), HasSubstr("encodeURI(\"" + escaped + "\");"));
}

TEST_F(EscapedPageScripts, StringsThatNeedNoEscapeLeaveTheScriptsAsTheyAre) {
    const std::string escaped = streamEventScript("name", "4142", "trigger", "tv");
    unsetenv("PLUGIN_ESCAPE_EVENTS");
    EXPECT_EQ(escaped, streamEventScript("name", "4142", "trigger", "tv"));
}

TEST_F(EscapedPageScripts, AnEmptyValueAndZeroAreAsNoneAtAll) {
    for (const char* value : {"", "0"}) {
        setenv("PLUGIN_ESCAPE_EVENTS", value, 1);
        EXPECT_EQ(literalText("\"\xFF"), "\"\xFF") << '"' << value << '"';
    }
    for (const char* value : {"1", "00", "no"}) {
        setenv("PLUGIN_ESCAPE_EVENTS", value, 1);
        EXPECT_EQ(literalText("\""), "\\\"") << value;
    }
}

TEST_F(EscapedPageScripts, AnApplicationsURLIsEscapedToo) {
    const EmbeddedObject manager = browser.embed("application/oipfapplicationmanager");
    const ObjectRef application = manager.call("getOwnerApplication", browser.document()).object();
    browser.whenEvaluating("window.createHbbTVApplication('http://a.example/?q=\\'x\\'');").gives(true);
    EXPECT_TRUE(application.call("createApplication", "http://a.example/?q='x'", false).value.isObject());
}

TEST_F(EscapedPageScripts, AStreamEventWithQuotesReachesThePage) {
    TELIX_JS_VB_STREAM_EVENT_CB callback = nullptr;
    platform.TELIX_JS_VB_GetHandle = [](TELIX_JS_VB_HANDLE* handle) {
        *handle = 7;
        return 0;
    };
    platform.TELIX_JS_VB_RegisterStreamEvent = [&](TELIX_JS_VB_HANDLE, TELIX_JS_VB_STREAM_EVENT_CB given,
                                                   const char*, const char*, const char*) {
        callback = given;
        return 0;
    };
    const EmbeddedObject object = browser.embed("video/broadcast", {{"id", "tv"}});
    object.call("addStreamEventListener", "dvb://1", "goal", "5", "7");
    const auto bytes = [](const char* text) { return reinterpret_cast<___UINT8*>(const_cast<char*>(text)); };
    callback(7, nullptr, nullptr, bytes("\"; alert(1); \""), bytes("22"), 2, bytes("trigger"));
    browser.pump();
    EXPECT_THAT(browser.eventTypes(), ::testing::ElementsAre("StreamEvent"));
    EXPECT_THAT(browser.lastScript(), HasSubstr("strEvent.name = \"\\\"; alert(1); \\\"\"; "));
}

} // namespace
