// Playlists: how a string is read, what is logged, and the order of the clips.
#include "src/avcontrol/Asx.h"

#include <gtest/gtest.h>
#include <malloc.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cctype>
#include <cstdlib>
#include <functional>
#include <ostream>
#include <random>
#include <string>
#include <vector>

namespace {

const std::string url = "http://host/list.asx";

// The lines that `work` logs, with the log switched on in a process of its own: a level once read stays.
std::vector<std::string> logOf(const std::function<void()>& work) {
    int ends[2];
    EXPECT_EQ(pipe(ends), 0);
    std::fflush(stdout);
    const pid_t child = fork();
    if (child == 0) {
        dup2(ends[1], STDOUT_FILENO);
        close(ends[0]);
        close(ends[1]);
        setenv("LOG_MODULE", "5", 1);
        work();
        std::fflush(stdout);
        _exit(0);
    }
    close(ends[1]);
    std::string text;
    char chunk[4096];
    for (ssize_t got; (got = read(ends[0], chunk, sizeof chunk)) > 0;) {
        text.append(chunk, static_cast<size_t>(got));
    }
    close(ends[0]);
    int status = -1;
    EXPECT_EQ(waitpid(child, &status, 0), child);
    EXPECT_EQ(status, 0);

    // The statements end without a line end, so the lines are parted by what each begins with.
    const std::string start = " PLUGIN >>> AVCONTROL :: ";
    std::vector<std::string> lines;
    size_t at = text.find(start);
    EXPECT_EQ(at, text.empty() ? std::string::npos : 0);
    while (at != std::string::npos) {
        at += start.size();
        const size_t next = text.find(start, at);
        lines.push_back(text.substr(at, next == std::string::npos ? next : next - at));
        at = next;
    }
    return lines;
}

using Lines = std::vector<std::string>;

class Asx : public testing::Test {
protected:
    // The strings of the whole list outlast a parse, so each test begins by setting them to nothing.
    void SetUp() override {
        asxParseAsx("<ASX><TITLE></TITLE><Author></Author><Copyright></Copyright><ABSTRACT></ABSTRACT>"
                    "<BASE HREF=\"\"/></ASX>",
                    "");
    }
    void TearDown() override { SetUp(); }

    static void parse(const std::string& text) { EXPECT_EQ(asxParseAsx(text.c_str(), url), 0); }

    static void parseBody(const std::string& body) { parse("<ASX VERSION=\"3.0\">" + body + "</ASX>"); }

    // What a parse of `body` logs in front of the line for the end tag.
    static Lines logOfBody(const std::string& body) {
        Lines lines = logOf([&] { parseBody(body); });
        if (!lines.empty() && lines.back().rfind("asxParseAsx :: ASX length = ", 0) == 0) {
            lines.pop_back();
        }
        return lines;
    }

    static Lines fileNames() {
        Lines names;
        for (unsigned index = 1; asxSetCurrentClipIndex(index); ++index) {
            names.push_back(asxShowClipFileName());
        }
        asxSetCurrentClipIndex(1);
        return names;
    }

    static std::string repeatLine() {
        for (const std::string& line : logOf(asxPrintAsxData)) {
            if (line.find("ASX Repeat") != std::string::npos) {
                return line;
            }
        }
        return {};
    }

    // The clips in the order in which a player comes to them, at most `limit` of them.
    static std::vector<unsigned> playOrder(size_t limit = 40) {
        std::vector<unsigned> order;
        while (order.size() < limit && asxGetCurrentClipIndex() != 0) {
            order.push_back(asxGetCurrentClipIndex());
            if (asxIsEndofRepeat()) {
                asxGotoStartofRepeat();
            } else if (!asxNextClip()) {
                break;
            }
        }
        return order;
    }

    static unsigned startTimeOf(const std::string& value, const std::string& rest = "") {
        parse("<ASX><Entry><Ref HREF=\"a\"/><starttime value=\"" + value + "\"/></Entry>" + rest);
        return asxGetStartTime();
    }
};

using Order = std::vector<unsigned>;

// A tag and the reader of the field that it sets.
template <typename Value>
struct TagAndField {
    const char* tag;
    Value (*field)();

    friend std::ostream& operator<<(std::ostream& out, const TagAndField& self) { return out << self.tag; }
};

const std::string clip = "<Entry><Ref HREF=\"clip\"/></Entry>";

// Recognition

TEST_F(Asx, TextWithTheTagInAnyCaseIsAPlaylistAndComesBackUnchanged) {
    const std::string text = "\xEF\xBB\xBF junk <aSx Version";
    EXPECT_EQ(asxIsAsxfile(text.c_str(), static_cast<unsigned>(text.size())), text);
    EXPECT_EQ(asxIsAsxfile("<ASX", 4), "<ASX");
    EXPECT_EQ(asxIsAsxfile("<<asx", 5), "<<asx");
}

TEST_F(Asx, OtherTextIsNoPlaylist) {
    EXPECT_EQ(asxIsAsxfile("", 0), "");
    EXPECT_EQ(asxIsAsxfile("<AS", 3), "");
    EXPECT_EQ(asxIsAsxfile("< ASX>", 6), "");
    EXPECT_EQ(asxIsAsxfile("[playlist]", 10), "");
    EXPECT_EQ(asxIsAsxfile(nullptr, 10), "");
}

TEST_F(Asx, DataIsReadToItsFirstZeroByteWhateverTheSize) {
    EXPECT_EQ(asxIsAsxfile("<ASX>abc", 1), "<ASX>abc");
    EXPECT_EQ(asxIsAsxfile("<ASX>\0abc", 9), "<ASX>");
    EXPECT_EQ(asxIsAsxfile("ab\0<ASX>", 8), "");
}

// The list as a whole

TEST_F(Asx, LowerCaseTagAloneGivesAnEmptyList) {
    EXPECT_NE(asxIsAsxfile("<asx", 4), "");
    parse("<asx");
    EXPECT_EQ(asxGetClipCount(), 0u);
    EXPECT_EQ(asxShowClipFileName(), "");
    parse("<asx>");
    EXPECT_EQ(asxGetClipCount(), 0u);
}

TEST_F(Asx, TextThatIsNoPlaylistEmptiesTheListButTakesTheUrl) {
    parseBody(clip);
    ASSERT_EQ(asxGetClipCount(), 1u);
    EXPECT_EQ(asxParseAsx("<Entry><Ref HREF=\"a\"/></Entry>", "other"), 0);
    EXPECT_EQ(asxGetClipCount(), 0u);
    EXPECT_EQ(asxGetCurrentClipIndex(), 0u);
    EXPECT_EQ(asxShowFileName(), "other");
    EXPECT_EQ(logOf([] { asxParseAsx("nothing", ""); }), Lines{});
}

TEST_F(Asx, TextsOutsideEntriesBelongToTheList) {
    parseBody("<TITLE>T</TITLE><Author>A</Author><Copyright>C</Copyright><ABSTRACT>D</ABSTRACT>" + clip);
    EXPECT_EQ(asxShowFileName(), url);
    EXPECT_EQ(asxShowTitle(), "T");
    EXPECT_EQ(asxShowAuthor(), "A");
    EXPECT_EQ(asxShowCopyRight(), "C");
    EXPECT_EQ(asxShowRating(), "");
    EXPECT_EQ(asxShowDescription(), "D");
    EXPECT_EQ(asxShowClipTitle(), "");
    EXPECT_EQ(asxShowClipAuthor(), "");
    EXPECT_EQ(asxShowClipCopyRight(), "");
    EXPECT_EQ(asxShowClipRating(), "");
    EXPECT_EQ(asxShowClipDescription(), "");
}

TEST_F(Asx, TextsWithinAnEntryBelongToItsClip) {
    parseBody("<Entry><Ref HREF=\"f\"/><TITLE>T</TITLE><Author>A</Author><Copyright>C</Copyright>"
              "<ABSTRACT>D</ABSTRACT></Entry><Entry><Ref HREF=\"g\"/><TITLE>U</TITLE></Entry>");
    EXPECT_EQ(asxShowTitle(), "");
    EXPECT_EQ(asxShowAuthor(), "");
    EXPECT_EQ(asxShowClipFileName(), "f");
    EXPECT_EQ(asxShowClipTitle(), "T");
    EXPECT_EQ(asxShowClipAuthor(), "A");
    EXPECT_EQ(asxShowClipCopyRight(), "C");
    EXPECT_EQ(asxShowClipRating(), "");
    EXPECT_EQ(asxShowClipDescription(), "D");
    EXPECT_EQ(asxNextClip(), 2u);
    EXPECT_EQ(asxShowClipFileName(), "g");
    EXPECT_EQ(asxShowClipTitle(), "U");
    EXPECT_EQ(asxShowClipAuthor(), "");
}

TEST_F(Asx, TagsMatchWithoutCase) {
    parse("<aSX><tItLe>T</TiTlE><AUTHOR>A</author><copyRIGHT>C</COPYright><abstract>D</ABstract>"
          "<bAsE href=\"b\"/><pARAM NAME=\"n\" VALUE=\"v\"/><rEPEAT COUNT=\"3\"><eNTRY CLIENTSKIP=\"NO\">"
          "<rEF href=\"f\"/><STARTTIME VALUE=\"2\"/><DuRaTiOn Value=\"3\"/></eNTRY></rEPEAT></asx>");
    EXPECT_EQ(asxShowTitle(), "T");
    EXPECT_EQ(asxShowAuthor(), "A");
    EXPECT_EQ(asxShowCopyRight(), "C");
    EXPECT_EQ(asxShowDescription(), "D");
    EXPECT_EQ(asxGetParamName(0, 1), "n");
    EXPECT_EQ(asxShowClipFileName(), "b/f");
    EXPECT_EQ(asxGetClientSkip(), 0u);
    EXPECT_EQ(asxGetStartTime(), 2u);
    EXPECT_EQ(asxGetDuration(), 3u);
    EXPECT_EQ(playOrder(), (Order{1, 1, 1}));
}

TEST_F(Asx, NothingIsReadBeforeTheEndOfTheFirstTag) {
    parse("<TITLE>before</TITLE><ASX <Entry <Ref HREF=\"in\"" + clip);
    EXPECT_EQ(asxShowTitle(), "");
    EXPECT_EQ(asxGetClipCount(), 0u); // the ">" found is the one of the entry's own tag
    parse("<ASX " + clip.substr(0, 6));
    EXPECT_EQ(asxGetClipCount(), 0u);
}

TEST_F(Asx, EntitiesAreNotDecoded) {
    parseBody("<TITLE>a &amp; <b> \"c\"</TITLE><Entry><Ref HREF=\"x?a=1&amp;b='2'\"/></Entry>");
    EXPECT_EQ(asxShowTitle(), "a &amp; <b> \"c\"");
    EXPECT_EQ(asxShowClipFileName(), "x?a=1&amp;b='2'");
}

TEST_F(Asx, TextsOfAnEarlierListStayWhereTheNextHasNone) {
    parseBody("<TITLE>T</TITLE><Author>A</Author><BASE HREF=\"http://base\"/>" + clip);
    asxClear();
    EXPECT_EQ(asxShowTitle(), "T");
    EXPECT_EQ(asxShowFileName(), url);
    parseBody("<Author>B</Author>" + clip);
    EXPECT_EQ(asxShowTitle(), "T");
    EXPECT_EQ(asxShowAuthor(), "B");
    EXPECT_EQ(asxShowClipFileName(), "http://base/clip");
}

TEST_F(Asx, ClearingEmptiesClipsParametersAndRepeat) {
    parseBody("<PARAM name=\"n\" value=\"v\"/><Repeat count=\"2\">" + clip + "</Repeat>" + clip);
    EXPECT_EQ(asxSetCurrentClipIndex(2), 1);
    asxClear();
    EXPECT_EQ(asxGetClipCount(), 0u);
    EXPECT_EQ(asxGetCurrentClipIndex(), 0u);
    EXPECT_EQ(asxGetParamName(0, 1), "");
    EXPECT_EQ(asxShowClipFileName(), "");
    EXPECT_EQ(repeatLine(), "asxPrintAsxData :: ASX Repeat: (0)0-0");
    asxClear();
}

TEST_F(Asx, NextParseReplacesTheList) {
    parseBody(clip + clip + clip);
    EXPECT_EQ(asxSetCurrentClipIndex(3), 1);
    parseBody("<Entry><Ref HREF=\"new\"/></Entry>");
    EXPECT_EQ(asxGetClipCount(), 1u);
    EXPECT_EQ(asxGetCurrentClipIndex(), 1u);
    EXPECT_EQ(asxShowClipFileName(), "new");
}

TEST_F(Asx, ListWithoutClipsKeepsNoParametersAndNoRepeat) {
    parseBody("<PARAM name=\"n\" value=\"v\"/><Repeat count=\"3\"></Repeat><TITLE>T</TITLE>");
    EXPECT_EQ(asxGetParamName(0, 1), "");
    EXPECT_EQ(repeatLine(), "asxPrintAsxData :: ASX Repeat: (0)0-0");
    EXPECT_EQ(asxShowTitle(), "T");
    EXPECT_EQ(logOfBody("<x>"), (Lines{"asxParseAsx :: ASX length = 23",
                                       "asxSetCurrentClipIndex :: ASX error (i=1, total=0)"}));
}

// Tags with a string

class AsxTextTag : public Asx, public testing::WithParamInterface<TagAndField<std::string>> {
protected:
    std::string open() const { return "<" + name() + ">"; }
    std::string close() const { return "</" + name() + ">"; }
    std::string name() const { return GetParam().tag; }
    std::string value() const { return GetParam().field(); }
};

TEST_P(AsxTextTag, TakesAllUpToItsOwnClosingTag) {
    parseBody(open() + " a\n<Entry>b</x> " + close() + clip);
    EXPECT_EQ(value(), " a\n<Entry>b</x> ");
    EXPECT_EQ(asxGetClipCount(), 1u);
    parseBody(open() + close() + clip);
    EXPECT_EQ(value(), "");
}

TEST_P(AsxTextTag, WithAnAttributeIsNotRecognisedAndItsTextIsSkipped) {
    parseBody("<" + name() + " lang=\"en\">text" + close() + clip);
    EXPECT_EQ(value(), "");
    EXPECT_EQ(asxGetClipCount(), 1u);
}

TEST_P(AsxTextTag, WithoutItsClosingTagEndsTheScan) {
    parse("<ASX>" + clip + open() + "text" + clip + "</ASX>");
    EXPECT_EQ(value(), "");
    EXPECT_EQ(asxGetClipCount(), 1u);
}

TEST_P(AsxTextTag, LastOneWins) {
    parseBody(open() + "one" + close() + clip + open() + "two" + close());
    EXPECT_EQ(value(), "two");
}

INSTANTIATE_TEST_SUITE_P(, AsxTextTag,
                         testing::Values(TagAndField<std::string>{"TITLE", asxShowTitle},
                                         TagAndField<std::string>{"Author", asxShowAuthor},
                                         TagAndField<std::string>{"Copyright", asxShowCopyRight},
                                         TagAndField<std::string>{"ABSTRACT", asxShowDescription}),
                         [](const auto& info) { return std::string(info.param.tag); });

// Comments, the end tag and anything else

TEST_F(Asx, TagsWithinACommentAreNotSeen) {
    parseBody("<!-- " + clip + " -->" + clip);
    EXPECT_EQ(asxGetClipCount(), 1u);
}

TEST_F(Asx, CommentWithoutAnEndEndsTheScan) {
    parseBody(clip + "<!-- " + clip);
    EXPECT_EQ(asxGetClipCount(), 1u);
}

TEST_F(Asx, CommentMayEndInItsOwnBeginning) {
    parseBody("<!-->" + clip + "<!--->" + clip);
    EXPECT_EQ(asxGetClipCount(), 2u);
}

TEST_F(Asx, UnknownTagsAreSteppedOver) {
    parseBody("<Banner HREF=\"x\"><<MoreInfo/><ASX></Title><Ent ry><Reference/>" + clip + "<");
    EXPECT_EQ(asxGetClipCount(), 1u);
}

TEST_F(Asx, TextAfterTheEndTagIsStillRead) {
    parse("<ASX>" + clip + "</ASX>" + clip);
    EXPECT_EQ(asxGetClipCount(), 2u);
}

TEST_F(Asx, EndTagLogsItsOffsetOneByteOn) {
    EXPECT_EQ(logOf([] { parse("--<ASX>" + clip + "</asx>  </ASX"); }),
              (Lines{"asxParseAsx :: ASX length = " + std::to_string(7 + clip.size() + 1),
                     "asxParseAsx :: ASX length = " + std::to_string(7 + clip.size() + 9)}));
}

// Parameters

TEST_F(Asx, ParametersBelongToTheOpenEntryOrToTheList) {
    parseBody("<PARAM name=\"g1\" value=\"v1\"/><Entry><PARAM name=\"e1\" value=\"w1\"/>"
              "<Ref HREF=\"a\"/><param  NAME = \"e2\"\tVALUE = \"w2\" /></Entry>"
              "<PARAM name=\"g2\" value=\"v2\"/>");
    EXPECT_EQ(asxGetParamName(0, 0), "");
    EXPECT_EQ(asxGetParamName(0, 1), "g1");
    EXPECT_EQ(asxGetParamName(0, 2), "g2");
    EXPECT_EQ(asxGetParamName(0, 3), "");
    EXPECT_EQ(asxGetParamName(1, 0), "");
    EXPECT_EQ(asxGetParamName(1, 1), "e1");
    EXPECT_EQ(asxGetParamName(1, 2), "e2");
    EXPECT_EQ(asxGetParamName(1, 3), "");
    EXPECT_EQ(asxGetParamName(2, 1), "");
    EXPECT_EQ(asxGetParamName(4294967295u, 1), "");
}

Lines paramLines() {
    Lines params;
    for (const std::string& line : logOf(asxPrintAsxData)) {
        const std::string start = "asxPrintAsxData :: ASX Param: ";
        if (line.rfind(start, 0) == 0) {
            params.push_back(line.substr(start.size()));
        }
    }
    return params;
}

TEST_F(Asx, ParameterTakesItsNameAndItsValue) {
    parseBody("<PARAM name=\"a\" value=\" x <y> \"/><PARAM\tname=\"not\" value=\"seen\"/>" + clip);
    EXPECT_EQ(paramLines(), (Lines{"a =  x <y> "}));
}

TEST_F(Asx, AttributeNamesMatchByTheirFirstLetters) {
    parseBody(
        "<PARAM names=\"a\" valued=\"1\"/><PARAM namevalue=\"b\" value2 more=\"2\"/><BASE HREFLANG=\"h\"/>"
        "<Entry><Ref hrefx=\"f\"/></Entry>");
    EXPECT_EQ(paramLines(), (Lines{"a = 1", "b = 2"}));
    EXPECT_EQ(asxShowClipFileName(), "h/f");
}

TEST_F(Asx, ParameterWithoutAValueIsKeptEmpty) {
    parseBody("<PARAM name=\"a\"/><PARAM name=\"b\" value=\"\"/><PARAM name=\"c\" other=\"x\"/>" + clip);
    EXPECT_EQ(paramLines(), (Lines{"a = ", "b = ", "c = "}));
    EXPECT_EQ(asxGetClipCount(), 1u);
}

TEST_F(Asx, ParameterWithoutANameIsNone) {
    parseBody("<PARAM name=\"\" value=\"x\"/><PARAM value=\"y\"/><PARAM -value=\"z\"/>" + clip);
    EXPECT_EQ(paramLines(), Lines{});
    EXPECT_EQ(asxGetClipCount(), 1u);
}

TEST_F(Asx, ParameterWithoutAnyAttributeHidesAllUpToTheNextSelfClosingTag) {
    parseBody("<PARAM /><Entry><Ref HREF=\"hidden\"/>" + clip);
    EXPECT_EQ(fileNames(), (Lines{"clip"}));
}

TEST_F(Asx, ParameterWithAMissingQuoteEndsTheScan) {
    parse("<ASX>" + clip + "<PARAM name=a " + clip.substr(0, 7) + "</ASX>");
    EXPECT_EQ(asxGetClipCount(), 1u);
    parse("<ASX>" + clip + "<PARAM name=\"a <Entry></ASX>");
    EXPECT_EQ(asxGetClipCount(), 1u);
    EXPECT_EQ(paramLines(), Lines{});
    parse("<ASX>" + clip + "<PARAM name=\"a\" value=x <Entry></ASX>");
    EXPECT_EQ(asxGetClipCount(), 1u);
    EXPECT_EQ(paramLines(), (Lines{"a = "}));
    parse("<ASX>" + clip + "<PARAM name=\"a\" value=\"x <Entry></ASX>");
    EXPECT_EQ(asxGetClipCount(), 1u);
    EXPECT_EQ(paramLines(), (Lines{"a = "}));
}

TEST_F(Asx, ParameterClosedByGreaterAloneHidesAllUpToTheNextSelfClosingTag) {
    parseBody("<PARAM name=\"a\" value=\"1\"><Entry><Ref HREF=\"hidden\"/>" + clip);
    EXPECT_EQ(paramLines(), (Lines{"a = 1"}));
    EXPECT_EQ(fileNames(), (Lines{"clip"}));
    parse("<ASX>" + clip + "<PARAM name=\"a\" value=\"1\"><Entry>");
    EXPECT_EQ(asxGetClipCount(), 1u);
    EXPECT_EQ(paramLines(), (Lines{"a = 1"}));
}

TEST_F(Asx, ParameterWithAnEmptyOrUselessValueHidesNothing) {
    parseBody("<PARAM name=\"a\" value=\"\">" + clip + "<PARAM -value=\"z\">" + clip + "<PARAM name=\"\">" +
              clip);
    EXPECT_EQ(asxGetClipCount(), 3u);
}

TEST_F(Asx, ParameterCutOffAnywhereIsReadNoFurtherThanTheText) {
    const std::string text = "<ASX>" + clip + "<PARAM name=\"a\" value=\"b\"/>";
    for (size_t length = text.find("<PARAM"); length <= text.size(); ++length) {
        parse(text.substr(0, length));
        EXPECT_EQ(asxGetClipCount(), 1u) << length;
    }
    parse("<ASX>" + clip + "<PARAM    ");
    EXPECT_EQ(asxGetClipCount(), 1u);
}

TEST_F(Asx, NoNameLeadsToAParametersValue) {
    parseBody(
        "<PARAM name=\"a\" value=\"1\"/><Entry><Ref HREF=\"f\"/><PARAM name=\"b\" value=\"2\"/></Entry>");
    EXPECT_EQ(asxGetParam(0, "a"), "");
    EXPECT_EQ(asxGetParam(1, "b"), "");
    EXPECT_EQ(asxGetParam(1, ""), "");
    EXPECT_EQ(asxGetParam(9, "a"), "");
}

// URLs

TEST_F(Asx, BaseAndPathAreJoinedByOneSlash) {
    EXPECT_EQ(asxAppendBaseUrl("http://a", "b"), "http://a/b");
    EXPECT_EQ(asxAppendBaseUrl("http://a/", "b"), "http://a/b");
    EXPECT_EQ(asxAppendBaseUrl("http://a", "/b"), "http://a//b");
    EXPECT_EQ(asxAppendBaseUrl("a", "http://b"), "a/http://b");
    EXPECT_EQ(asxAppendBaseUrl("/", "b"), "/b");
    EXPECT_EQ(asxAppendBaseUrl("", "b"), "");
    EXPECT_EQ(asxAppendBaseUrl("a", ""), "");
}

TEST_F(Asx, AddressLosesLeadingBlanksAndKeepsTrailingOnes) {
    parseBody("<Entry><Ref HREF=\" \t\r\nhttp://a/b.mp4 \r\n\"/></Entry>");
    EXPECT_EQ(asxShowClipFileName(), "http://a/b.mp4 \r\n");
}

TEST_F(Asx, LastAddressOfAnEntryWins) {
    parseBody("<Entry><Ref HREF=\"one\"/><Ref HREF=\"two\"/></Entry>");
    EXPECT_EQ(fileNames(), (Lines{"two"}));
}

TEST_F(Asx, BlankOrEmptyAddressChangesNothing) {
    parseBody("<Entry><Ref HREF=\"one\"/><Ref HREF=\"\"/><Ref HREF=\" \n\"/></Entry>" + clip);
    EXPECT_EQ(fileNames(), (Lines{"one", "clip"}));
}

TEST_F(Asx, RefWithoutAnAddressIsPassed) {
    parseBody("<Entry><Ref src=\"<Entry\"><Ref HREF=\"one\"/></Entry>");
    EXPECT_EQ(fileNames(), (Lines{"one"}));
}

TEST_F(Asx, RefWithAMissingTokenEndsTheScan) {
    parse("<ASX><Entry><Ref HREF=one></Entry><Entry>");
    EXPECT_EQ(fileNames(), (Lines{""}));
    parse("<ASX><Entry><Ref HREF=\"one></Entry><Entry>");
    EXPECT_EQ(fileNames(), (Lines{""}));
    parse("<ASX><Entry><Ref HREF=\"one\"</Entry");
    EXPECT_EQ(fileNames(), (Lines{"one"}));
    parse("<ASX><Entry><Ref src=\"one\"<Entry");
    EXPECT_EQ(fileNames(), (Lines{""}));
}

TEST_F(Asx, RefOutsideAnEntryIsLogged) {
    EXPECT_EQ(logOfBody(clip + "<Ref HREF=\"x\"/>"),
              (Lines{"asxParseAsx :: A ref outside an entry section"}));
    parseBody(clip + "<Ref HREF=\"<Entry>\"/>");
    EXPECT_EQ(asxGetClipCount(), 2u); // the scan goes on within the tag
}

TEST_F(Asx, BaseIsAppliedToRelativeAndAbsoluteAddressesAlike) {
    parseBody("<BASE HREF=\"http://base/\"/><Entry><Ref HREF=\"a\"/></Entry>"
              "<Entry><Ref HREF=\"http://other/b\"/></Entry>");
    EXPECT_EQ(fileNames(), (Lines{"http://base/a", "http://base/http://other/b"}));
}

TEST_F(Asx, BaseOfAnEntryGoesBeforeTheOneOfTheList) {
    parseBody("<BASE HREF=\"list\"/><Entry><BASE HREF=\"own\"/><Ref HREF=\"a\"/></Entry>"
              "<Entry><Ref HREF=\"b\"/><BASE HREF=\"late\"/></Entry>");
    EXPECT_EQ(fileNames(), (Lines{"own/a", "list/b"}));
}

TEST_F(Asx, JoinedAddressOutlivesItsEntryWhereNoBaseFollows) {
    parseBody("<Entry><Ref HREF=\"a\"/></Entry><Entry><BASE HREF=\"own\"/><Ref HREF=\"b\"/></Entry>"
              "<Entry><Ref HREF=\"c\"/></Entry><Entry><BASE HREF=\"two\"/><Ref HREF=\"d\"/></Entry>"
              "<Entry><Ref HREF=\"e\"/></Entry>");
    EXPECT_EQ(fileNames(), (Lines{"a", "own/b", "own/b", "two/d", "two/d"}));
    parseBody("<Entry><Ref HREF=\"f\"/></Entry>");
    EXPECT_EQ(fileNames(), (Lines{"f"}));
}

TEST_F(Asx, BaseOfTheListHoldsAlsoForTheNextListWhichReplacesItsText) {
    parseBody("<BASE HREF=\"first\"/><Entry><Ref HREF=\"a\"/></Entry>");
    parseBody("<Entry><Ref HREF=\"b\"/></Entry><BASE HREF=\"second\"/><Entry><Ref HREF=\"c\"/></Entry>");
    EXPECT_EQ(fileNames(), (Lines{"first/b", "second/c"}));
    asxClear();
    parseBody("<Entry><Ref HREF=\"d\"/></Entry>");
    EXPECT_EQ(fileNames(), (Lines{"second/d"}));
}

TEST_F(Asx, LongBaseBeforeManyAddressesTakesMemoryOnce) {
    const std::string base(100000, 'b');
    std::string body = "<BASE HREF=\"" + base + "\"/>";
    for (int i = 0; i < 1000; ++i) {
        body += "<Entry><Ref HREF=\"a\"/></Entry>";
    }
    const auto inUse = [] {
        const struct mallinfo2 info = mallinfo2();
        return info.uordblks + info.hblkhd;
    };
    const size_t before = inUse();
    parseBody(body);
    EXPECT_EQ(asxGetClipCount(), 1000u);
    EXPECT_EQ(asxShowClipFileName(), base + "/a");
    EXPECT_LT(inUse() - before, 10 * body.size()); // joined with each address it would be 100 MB
}

TEST_F(Asx, BaseWithoutAnAddressIsPassed) {
    parseBody("<BASE name=\"<Entry>\"/>" + clip);
    EXPECT_EQ(fileNames(), (Lines{"clip"}));
}

TEST_F(Asx, BaseWithAMissingTokenEndsTheScan) {
    for (const char* base : {"<BASE HREF=<Entry>", "<BASE HREF=\"b><Entry>", "<BASE name=b><Entry>"}) {
        parse("<ASX>" + clip + base);
        EXPECT_EQ(asxGetClipCount(), 1u) << base;
    }
    parse("<ASX>" + clip + "<BASE HREF=\"kept\"><Entry>");
    EXPECT_EQ(asxGetClipCount(), 1u);
    parseBody(clip);
    EXPECT_EQ(fileNames(), (Lines{"kept/clip"}));
}

TEST_F(Asx, BaseClosedByGreaterAloneHidesAllUpToTheNextSelfClosingTag) {
    parseBody("<BASE HREF=\"b\"></BASE><Entry><Ref HREF=\"hidden\"/>" + clip);
    EXPECT_EQ(fileNames(), (Lines{"b/clip"}));
}

// Entries

TEST_F(Asx, EntryMayRefuseToBeSkipped) {
    parseBody("<Entry ClientSkip=\"No\"><Ref HREF=\"a\"/></Entry><Entry clientskip=\"yes\"><Ref "
              "HREF=\"b\"/></Entry>"
              "<Entry><Ref HREF=\"clientskip=\"no\"\"/></Entry><Entry x=\"1\"clientskip=\"no\">");
    EXPECT_EQ(asxGetClientSkip(), 0u);
    EXPECT_EQ(asxNextClip(), 2u);
    EXPECT_EQ(asxGetClientSkip(), 1u);
    EXPECT_EQ(asxNextClip(), 3u);
    EXPECT_EQ(asxGetClientSkip(), 1u);
    EXPECT_EQ(asxNextClip(), 4u);
    EXPECT_EQ(asxGetClientSkip(), 0u);
}

TEST_F(Asx, EntryTagWithoutItsEndEndsTheScan) {
    parse("<ASX>" + clip + "<Entry <TITLE");
    EXPECT_EQ(asxGetClipCount(), 1u);
}

TEST_F(Asx, AnyTagThatBeginsLikeAnEntryIsOne) {
    parseBody("<EntryRef HREF=\"x\"/><Ref HREF=\"a\"/></Entry><Entryway><Ref HREF=\"b\"/></Entry>");
    EXPECT_EQ(fileNames(), (Lines{"a", "b"}));
}

TEST_F(Asx, EntryWithinAnEntryIsLoggedAndNotCounted) {
    EXPECT_EQ(logOfBody("<Entry><Ref HREF=\"a\"/><Entry><Ref HREF=\"b\"/></Entry>"),
              (Lines{"asxParseAsx :: We already are in an entry section"}));
    parseBody("<Entry><Ref HREF=\"a\"/><Entry><Ref HREF=\"b\"/></Entry>");
    EXPECT_EQ(fileNames(), (Lines{"b"}));
}

TEST_F(Asx, FirstEntryWithoutAnAddressStaysOpen) {
    const std::string body = "<Entry></Entry><Entry><Ref HREF=\"a\"/></Entry>";
    EXPECT_EQ(logOfBody(body), (Lines{"asxParseAsx :: entry without href?",
                                      "asxParseAsx :: We already are in an entry section"}));
    parseBody(body);
    EXPECT_EQ(fileNames(), (Lines{"a"}));
}

TEST_F(Asx, LaterEntryWithoutAnAddressClosesWithNone) {
    const std::string body = clip + "<Entry></Entry><Entry><Ref HREF=\"b\"/></Entry>";
    EXPECT_EQ(logOfBody(body), Lines{});
    parseBody(body);
    EXPECT_EQ(fileNames(), (Lines{"clip", "", "b"}));
}

TEST_F(Asx, EntryStillOpenAtTheEndCounts) {
    parseBody("<Entry><Ref HREF=\"a\"/>");
    EXPECT_EQ(fileNames(), (Lines{"a"}));
}

TEST_F(Asx, EndOfAnEntryWithoutAStartIsLogged) {
    EXPECT_EQ(
        logOfBody("</Entry>" + clip + "</Entry>"),
        (Lines{"asxParseAsx :: end of entry without start?", "asxParseAsx :: end of entry without start?"}));
}

// Times

TEST_F(Asx, TimeIsSecondsOrMinutesAndSecondsOrHoursMinutesAndSeconds) {
    EXPECT_EQ(startTimeOf("30"), 30u);
    EXPECT_EQ(startTimeOf("1:30"), 90u);
    EXPECT_EQ(startTimeOf("1:02:03"), 3723u);
    EXPECT_EQ(startTimeOf(" 1: 2:\t3"), 3723u);
    EXPECT_EQ(startTimeOf("90:00"), 5400u);
    EXPECT_EQ(startTimeOf(":5"), 5u);
    EXPECT_EQ(startTimeOf("::7"), 7u);
    EXPECT_EQ(startTimeOf("1:2:3:4"), 3723u);
}

TEST_F(Asx, TimeStopsAtTheFirstOtherCharacter) {
    EXPECT_EQ(startTimeOf("12.9"), 12u);
    EXPECT_EQ(startTimeOf("00:00:05.75"), 5u);
    EXPECT_EQ(startTimeOf("x5"), 0u);
    EXPECT_EQ(startTimeOf("-5"), 0u);
    EXPECT_EQ(startTimeOf("1x:30"), 90u);
    EXPECT_EQ(startTimeOf("  "), 0u);
}

TEST_F(Asx, LaterColonsInTheTextMultiplyATime) {
    EXPECT_EQ(startTimeOf("30", "<!-- : -->"), 1800u);
    EXPECT_EQ(startTimeOf("30", "<!-- :: -->"), 108000u);
    EXPECT_EQ(startTimeOf("30", "<!-- ::: -->"), 108000u);
    EXPECT_EQ(startTimeOf("1:30", ":9"), 5400u);
    EXPECT_EQ(startTimeOf("30", "<Entry><Ref HREF=\"http://a:80/\"/></Entry>"), 108000u);
    EXPECT_EQ(startTimeOf("1:02:03", "::"), 3723u);
}

TEST_F(Asx, EarlierColonsInTheTextDoNot) {
    parse(":<ASX><Entry><Ref HREF=\"http://a:80/\"/><duration value=\"1:2\"/><starttime "
          "value=\"30\"/></Entry>");
    EXPECT_EQ(asxGetStartTime(), 30u);
    EXPECT_EQ(asxGetDuration(), 62u);
}

TEST_F(Asx, EachTimeHasItsOwnFollowingColons) {
    parse("<ASX><Entry><Ref HREF=\"a\"/><starttime value=\"1\"/></Entry>"
          "<Entry><starttime value=\"2:1\"/></Entry><Entry><starttime value=\"3\"/></Entry>"
          "<Entry><starttime value=\"4:0:1\"/></Entry><Entry><starttime value=\"5\"/></Entry>"
          "<Entry><starttime value=\"6:7\"/></Entry><Entry><starttime value=\"8\"/></Entry>");
    const unsigned expected[] = {3600, 7260, 10800, 14401, 300, 367, 8};
    for (const unsigned seconds : expected) {
        EXPECT_EQ(asxGetStartTime(), seconds);
        asxNextClip();
    }
}

TEST_F(Asx, NumberThatGrowsTooLargeIsZeroUnlessItWrapsToALargerOne) {
    EXPECT_EQ(startTimeOf("2147483647"), 2147483647u);
    EXPECT_EQ(startTimeOf("2147483648"), 0u);
    EXPECT_EQ(startTimeOf("4294967295"), 0u);
    EXPECT_EQ(startTimeOf("15000000000"), 2115098112u);
    EXPECT_EQ(startTimeOf("71582789:0"), 44u); // times 60 it wraps
}

TEST_F(Asx, DurationIsReadLikeAStartTime) {
    parse("<ASX><Entry><Ref HREF=\"a\"/><duration  value=\"1:30\"><duration other=\"9\"></Entry>");
    EXPECT_EQ(asxGetDuration(), 90u);
    EXPECT_EQ(asxGetStartTime(), 0u);
}

class AsxTimeTag : public Asx, public testing::WithParamInterface<TagAndField<unsigned>> {
protected:
    std::string tag() const { return "<" + std::string(GetParam().tag) + " "; }
    unsigned value() const { return GetParam().field(); }
};

TEST_P(AsxTimeTag, WithoutOrWithAnEmptyValueChangesNothing) {
    parse("<ASX><Entry><Ref HREF=\"a\"/>" + tag() + "value=\"7\"/>" + tag() + "/>" + tag() + "value=\"\"/>" +
          tag() + "x=\"<Entry>\"/></Entry>" + clip);
    EXPECT_EQ(value(), 7u);
    EXPECT_EQ(asxGetClipCount(), 2u);
}

TEST_P(AsxTimeTag, WithAMissingTokenEndsTheScan) {
    for (const char* rest : {"value=7><Entry>", "value=\"7><Entry>", "value=\"\"", "other"}) {
        parse("<ASX>" + clip + "<Entry>" + tag() + rest);
        EXPECT_EQ(asxGetClipCount(), 2u) << rest;
        EXPECT_EQ(asxNextClip(), 2u);
        EXPECT_EQ(value(), 0u) << rest;
    }
    parse("<ASX><Entry>" + tag() + "value=\"7\"");
    EXPECT_EQ(value(), 7u);
}

TEST_P(AsxTimeTag, OutsideAnEntryIsLogged) {
    EXPECT_EQ(logOfBody(clip + tag() + "value=\"7\"/>"),
              (Lines{"asxParseAsx :: " + std::string(GetParam().tag) + " outside an entry section"}));
}

INSTANTIATE_TEST_SUITE_P(, AsxTimeTag,
                         testing::Values(TagAndField<unsigned>{"starttime", asxGetStartTime},
                                         TagAndField<unsigned>{"duration", asxGetDuration}),
                         [](const auto& info) { return std::string(info.param.tag); });

// Repeat sections

std::string sectionBetweenClips(const std::string& tag, const std::string& clips) {
    return clip + tag + clips + "</Repeat>" + clip;
}

TEST_F(Asx, RepeatCountOfTwoPlaysTheSectionTwice) {
    parseBody(clip + "<Repeat count=\"2\">" + clip + clip + "</Repeat>" + clip);
    EXPECT_EQ(playOrder(), (Order{1, 2, 3, 2, 3, 4}));
    EXPECT_EQ(repeatLine(), "asxPrintAsxData :: ASX Repeat: (2)2-3");
}

TEST_F(Asx, EverySectionAndCountIsPlayedThatManyTimes) {
    for (unsigned clips = 1; clips <= 4; ++clips) {
        for (unsigned first = 1; first <= clips; ++first) {
            for (unsigned last = first; last <= clips; ++last) {
                for (unsigned count = 1; count <= 3; ++count) {
                    std::string body;
                    Order expected;
                    for (unsigned i = 1; i <= clips; ++i) {
                        body += i == first ? "<Repeat count=\"" + std::to_string(count) + "\">" : "";
                        body += clip;
                        body += i == last ? "</Repeat>" : "";
                        expected.push_back(i);
                        for (unsigned pass = 1; i == last && pass < count; ++pass) {
                            for (unsigned again = first; again <= last; ++again) {
                                expected.push_back(again);
                            }
                        }
                    }
                    parseBody(body);
                    EXPECT_EQ(playOrder(), expected) << body;
                }
            }
        }
    }
}

TEST_F(Asx, RepeatWithoutACountHasNoEnd) {
    for (const char* tag : {"<Repeat>", "<Repeat times=\"2\">", "<RepeatSection >"}) {
        parseBody(sectionBetweenClips(tag, clip + clip));
        EXPECT_EQ(playOrder(8), (Order{1, 2, 3, 2, 3, 2, 3, 2})) << tag;
    }
    EXPECT_EQ(repeatLine(), "asxPrintAsxData :: ASX Repeat: (-1)2-3");
}

TEST_F(Asx, RepeatCountOfZeroHasNoEffect) {
    for (const char* count : {"0", "none", " ", "99999999999999999999"}) {
        parseBody(sectionBetweenClips(std::string("<Repeat count=\"").append(count).append("\">"), clip));
        EXPECT_EQ(playOrder(), (Order{1, 2, 3})) << count;
        EXPECT_EQ(repeatLine(), "asxPrintAsxData :: ASX Repeat: (0)0-0");
    }
}

TEST_F(Asx, RepeatWithAnEmptyCountHasNoEffectAndItsTagIsReadOn) {
    parseBody("<Repeat count=\"\"" + clip + "</Repeat>" + clip);
    EXPECT_EQ(playOrder(), (Order{1, 2}));
}

TEST_F(Asx, SectionOfOneClipBeginsAgainWithoutMoving) {
    parseBody("<Repeat count=\"3\">" + clip + "</Repeat>" + clip);
    EXPECT_EQ(asxIsEndofRepeat(), 1);
    asxGotoStartofRepeat();
    EXPECT_EQ(asxGetCurrentClipIndex(), 1u);
    EXPECT_EQ(asxIsEndofRepeat(), 1);
    asxGotoStartofRepeat();
    EXPECT_EQ(asxIsEndofRepeat(), 0);
    EXPECT_EQ(asxNextClip(), 2u);
}

TEST_F(Asx, SecondSectionIsRefusedAndMakesTheFirstEndless) {
    const std::string body =
        "<Repeat count=\"2\">" + clip + "</Repeat><Repeat count=\"3\">" + clip + "</Repeat>" + clip;
    EXPECT_EQ(logOfBody(body), (Lines{"asxParseAsx :: We already are in an repeat section"}));
    parseBody(body);
    EXPECT_EQ(repeatLine(), "asxPrintAsxData :: ASX Repeat: (0)1-1");
    EXPECT_EQ(playOrder(5), (Order{1, 1, 1, 1, 1}));
}

TEST_F(Asx, SectionWithinASectionIsRefusedAndItsEndEndsTheOuterOne) {
    const std::string body =
        "<Repeat>" + clip + "<Repeat count=\"2\">" + clip + "</Repeat>" + clip + "</Repeat>" + clip;
    EXPECT_EQ(logOfBody(body), (Lines{"asxParseAsx :: We already are in an repeat section"}));
    parseBody(body);
    EXPECT_EQ(repeatLine(), "asxPrintAsxData :: ASX Repeat: (0)1-2");
}

TEST_F(Asx, EndOfARepeatWithoutAStartIsLogged) {
    EXPECT_EQ(logOfBody("</Repeat>" + clip), (Lines{"asxParseAsx :: end of repeat without start"}));
}

TEST_F(Asx, RepeatWithoutItsEndTagIsNoSection) {
    parseBody("<Repeat count=\"2\">" + clip + clip);
    EXPECT_EQ(repeatLine(), "asxPrintAsxData :: ASX Repeat: (0)1-0");
    EXPECT_EQ(playOrder(), (Order{1, 2}));
}

TEST_F(Asx, SectionWithoutAClipReplaysTheClipBeforeIt) {
    parseBody(clip + "<Repeat count=\"2\"></Repeat>" + clip);
    EXPECT_EQ(repeatLine(), "asxPrintAsxData :: ASX Repeat: (2)0-1");
    EXPECT_EQ(playOrder(4), (Order{1, 1, 1, 1})); // there is no start to go to, so no pass is counted
}

TEST_F(Asx, RepeatWithAMissingTokenEndsTheScan) {
    for (const char* tag : {"<Repeat count=2><Entry>", "<Repeat count=\"2><Entry>",
                            "<Repeat count=\"2\"<Entry", "<Repeat <Entry"}) {
        parse("<ASX>" + clip + tag);
        EXPECT_EQ(asxGetClipCount(), 1u) << tag;
        EXPECT_EQ(playOrder(), (Order{1})) << tag;
    }
}

TEST_F(Asx, MovingByHandCountsNoPass) {
    parseBody("<Repeat count=\"2\">" + clip + clip + "</Repeat>" + clip);
    for (int i = 0; i < 3; ++i) {
        EXPECT_EQ(asxNextClip(), 2u);
        EXPECT_EQ(asxIsEndofRepeat(), 1);
        EXPECT_EQ(asxNextClip(), 3u);
        EXPECT_EQ(asxIsEndofRepeat(), 0);
        EXPECT_EQ(asxPrevClip(), 2u);
        EXPECT_EQ(asxPrevClip(), 1u);
    }
    asxGotoStartofRepeat();
    EXPECT_EQ(asxGetCurrentClipIndex(), 1u);
    EXPECT_EQ(asxNextClip(), 2u);
    EXPECT_EQ(asxIsEndofRepeat(), 0);
}

TEST_F(Asx, WithoutASectionNothingIsRepeated) {
    parseBody(clip + clip);
    EXPECT_EQ(asxIsEndofRepeat(), 0);
    EXPECT_EQ(asxNextClip(), 2u);
    asxGotoStartofRepeat();
    EXPECT_EQ(asxGetCurrentClipIndex(), 2u);
}

// Moving

TEST_F(Asx, WithoutAListNothingMoves) {
    EXPECT_EQ(asxGetClipCount(), 0u);
    EXPECT_EQ(asxGetCurrentClipIndex(), 0u);
    EXPECT_EQ(asxNextClip(), 0u);
    EXPECT_EQ(asxPrevClip(), 0u);
    EXPECT_EQ(asxSetCurrentClipIndex(0), 0);
    EXPECT_EQ(asxSetCurrentClipIndex(1), 0);
    EXPECT_EQ(asxIsEndofRepeat(), 0);
    asxGotoStartofRepeat();
    EXPECT_EQ(asxGetCurrentClipIndex(), 0u);
    EXPECT_EQ(asxGetClientSkip(), 1u);
    EXPECT_EQ(asxGetStartTime(), 0u);
    EXPECT_EQ(asxGetDuration(), 0u);
    EXPECT_EQ(asxShowClipFileName(), "");
    EXPECT_EQ(asxGetParamName(0, 1), "");
    EXPECT_EQ(asxGetParamName(1, 1), "");
    EXPECT_EQ(logOf([] {
                  asxNextClip();
                  asxPrevClip();
                  asxSetCurrentClipIndex(0);
                  asxIsEndofRepeat();
                  asxGotoStartofRepeat();
              }),
              Lines{});
}

TEST_F(Asx, ParseMakesTheFirstClipCurrentAndTheWalkEndsAtBothEnds) {
    parseBody(clip + clip + clip);
    EXPECT_EQ(asxGetCurrentClipIndex(), 1u);
    EXPECT_EQ(asxPrevClip(), 0u);
    EXPECT_EQ(asxNextClip(), 2u);
    EXPECT_EQ(asxNextClip(), 3u);
    EXPECT_EQ(asxNextClip(), 0u);
    EXPECT_EQ(asxGetCurrentClipIndex(), 3u);
    EXPECT_EQ(asxPrevClip(), 2u);
    EXPECT_EQ(asxPrevClip(), 1u);
    EXPECT_EQ(asxGetCurrentClipIndex(), 1u);
}

TEST_F(Asx, BothEndsAreLogged) {
    parseBody(clip + clip);
    EXPECT_EQ(logOf([] {
                  asxPrevClip();
                  asxNextClip();
                  asxNextClip();
              }),
              (Lines{"asxPrevClip :: ASX asxPrevClip : first index (c=1, t=2)",
                     "asxNextClip :: ASX asxNextClip : last index (c=2, t=2)"}));
}

TEST_F(Asx, ClipIsChosenByItsIndex) {
    parseBody(clip + clip + clip);
    EXPECT_EQ(asxSetCurrentClipIndex(3), 1);
    EXPECT_EQ(asxGetCurrentClipIndex(), 3u);
    EXPECT_EQ(asxSetCurrentClipIndex(0), 0);
    EXPECT_EQ(asxSetCurrentClipIndex(4), 0);
    EXPECT_EQ(asxSetCurrentClipIndex(4294967295u), 0);
    EXPECT_EQ(asxGetCurrentClipIndex(), 3u);
    EXPECT_EQ(logOf([] {
                  asxSetCurrentClipIndex(0);
                  asxSetCurrentClipIndex(4);
              }),
              (Lines{"asxSetCurrentClipIndex :: ASX error (i=4, total=3)"}));
}

// The log of everything

TEST_F(Asx, PrintLogsTheListAndEachClip) {
    parseBody("<TITLE>T</TITLE><Author>A</Author><Copyright>C</Copyright><ABSTRACT>D</ABSTRACT>"
              "<PARAM name=\"n\" value=\"v\"/><Repeat count=\"2\"><Entry clientskip=\"no\"><Ref HREF=\"f\"/>"
              "<TITLE>t</TITLE><Author>a</Author><Copyright>c</Copyright><ABSTRACT>d</ABSTRACT>"
              "<starttime value=\"5:0:0\"/><duration value=\"0:1:0\"/><PARAM name=\"m\" value=\"w\"/></Entry>"
              "</Repeat>" +
              clip);
    EXPECT_EQ(asxSetCurrentClipIndex(2), 1);
    Lines expected = {
        "ASX File Name: " + url, "ASX Title: T",       "ASX Author: A",      "ASX CopyRight: C",
        "ASX Rating: ",          "ASX Description: D", "ASX Param: n = v",   "ASX Repeat: (2)1-1",
        "ASX Clip - 1",          "ASX File Name: f",   "ASX Title: t",       "ASX Author: a",
        "ASX CopyRight: c",      "ASX Rating: ",       "ASX Description: d", "ASX ClientSkip: 0",
        "ASX Start time: 18000", "ASX Duration: 60",   "ASX Param: m = w",   "ASX Clip - 2",
        "ASX File Name: clip",   "ASX Title: ",        "ASX Author: ",       "ASX CopyRight: ",
        "ASX Rating: ",          "ASX Description: ",  "ASX ClientSkip: 1",  "ASX Start time: 0",
        "ASX Duration: 0"};
    for (std::string& line : expected) {
        line.insert(0, "asxPrintAsxData :: ");
    }
    expected.emplace_back("asxNextClip :: ASX asxNextClip : last index (c=2, t=2)");
    expected.emplace_back("asxPrintAsxData :: ASX Total Clip Number: 2");
    EXPECT_EQ(logOf(asxPrintAsxData), expected);
    asxPrintAsxData();
    EXPECT_EQ(asxGetCurrentClipIndex(), 1u);
}

TEST_F(Asx, PrintOfAnEmptyListLogsItsFailureToFindAClip) {
    const Lines lines = logOf(asxPrintAsxData);
    ASSERT_EQ(lines.size(), 9u);
    EXPECT_EQ(lines[6], "asxPrintAsxData :: ASX Repeat: (0)0-0");
    EXPECT_EQ(lines[7], "asxSetCurrentClipIndex :: ASX error (i=1, total=0)");
    EXPECT_EQ(lines[8], "asxPrintAsxData :: ASX Total Clip Number: 0");
}

// Large playlists: each of these would take minutes or hours if a search ran through the rest of the string
// for every tag.

TEST_F(Asx, HundredThousandClipsInTenMegabytesAreRead) {
    std::string body;
    for (unsigned i = 1; i <= 100000; ++i) {
        const std::string number = std::to_string(i);
        body.append("<Entry><TITLE>Clip number ").append(number).append("</TITLE>");
        body.append("<Ref HREF=\"http://media.host/path/").append(number).append(".mp4\"/></Entry>\n");
    }
    parseBody(body);
    EXPECT_EQ(asxGetClipCount(), 100000u);
    unsigned walked = 1;
    while (asxNextClip()) {
        ++walked;
    }
    EXPECT_EQ(walked, 100000u);
    EXPECT_EQ(asxShowClipFileName(), "http://media.host/path/100000.mp4");
    EXPECT_EQ(asxSetCurrentClipIndex(50000), 1);
    EXPECT_EQ(asxShowClipTitle(), "Clip number 50000");
}

TEST_F(Asx, TimesFarFromTheNextColonAreRead) {
    std::string body = "<Entry><Ref HREF=\"a\"/>";
    while (body.size() < 10u << 20) {
        body += "<duration value=\"2\"/>";
    }
    parseBody(body);
    EXPECT_EQ(asxGetDuration(), 2u);
    parseBody(body + ":");
    EXPECT_EQ(asxGetDuration(), 120u);
    parseBody(body + "::");
    EXPECT_EQ(asxGetDuration(), 7200u);
}

TEST_F(Asx, EntriesFarFromTheNextSkipAttributeAreRead) {
    std::string body = "<Entry><Ref HREF=\"a\"/></Entry>";
    while (body.size() < 4u << 20) {
        body += "<Entry></Entry>";
    }
    parseBody(body + "<Entry clientskip=\"no\">");
    EXPECT_EQ(asxGetClientSkip(), 1u);
    EXPECT_EQ(asxSetCurrentClipIndex(asxGetClipCount()), 1);
    EXPECT_EQ(asxGetClientSkip(), 0u);
}

TEST_F(Asx, TagsThatNothingClosesAreSteppedOver) {
    for (const char* piece :
         {"<", "<TITLE ", "<Ref ", "<Entry", "<Repeat", "<starttime ", "</Entry>", "</ASX"}) {
        std::string body = clip;
        while (body.size() < 2u << 20) {
            body += piece;
        }
        parse("<ASX>" + body);
        EXPECT_EQ(asxGetClipCount(), 1u) << piece;
    }
}

// Random playlists

std::string randomText(std::mt19937& random) {
    static const char* const pieces[] = {"<ASX>",
                                         "</ASX>",
                                         "<Entry>",
                                         "<Entry clientskip=\"no\">",
                                         "<Entry",
                                         "</Entry>",
                                         "<Ref HREF=\"u/1\"/>",
                                         "<Ref ",
                                         "HREF=\"",
                                         "\"",
                                         ">",
                                         "/>",
                                         "<",
                                         " ",
                                         "\n",
                                         "<BASE HREF=\"base\"/>",
                                         "<BASE ",
                                         "<TITLE>t</TITLE>",
                                         "<TITLE>",
                                         "</TITLE>",
                                         "<Author>a</Author>",
                                         "<Copyright>c</Copyright>",
                                         "<ABSTRACT>d</ABSTRACT>",
                                         "<PARAM name=\"n\" value=\"v\"/>",
                                         "<PARAM ",
                                         "name",
                                         "value=\"",
                                         "<Repeat>",
                                         "<Repeat count=\"2\">",
                                         "<Repeat count=\"",
                                         "</Repeat>",
                                         "<starttime value=\"1:2\"/>",
                                         "<duration value=\"3\"/>",
                                         "<duration ",
                                         ":",
                                         "17",
                                         "99999999999",
                                         "<!--",
                                         "-->",
                                         "<!-- x -->",
                                         "x",
                                         "\xC3\xA4"};
    std::uniform_int_distribution<size_t> piece(0, std::size(pieces) - 1);
    std::uniform_int_distribution<int> length(0, 60);
    std::uniform_int_distribution<int> percent(0, 99);
    std::string text = "<ASX>";
    for (int i = length(random); i > 0; --i) {
        text += percent(random) < 15 ? "<Entry><Ref HREF=\"clip\"/></Entry>" : pieces[piece(random)];
        if (percent(random) < 5) {
            text.pop_back();
        }
    }
    return text;
}

// All that can be read from the list, in one string.
std::string contents() {
    std::string all;
    const auto add = [&all](const std::string& text) { all.append(text).append("|"); };
    for (const auto& show :
         {asxShowTitle, asxShowAuthor, asxShowCopyRight, asxShowRating, asxShowDescription}) {
        add(show());
    }
    for (unsigned index = 0; index <= asxGetClipCount(); ++index) {
        if (index > 0) {
            EXPECT_EQ(asxSetCurrentClipIndex(index), 1);
            for (const auto& show : {asxShowClipFileName, asxShowClipTitle, asxShowClipAuthor,
                                     asxShowClipCopyRight, asxShowClipRating, asxShowClipDescription}) {
                add(show());
            }
            for (const auto& get : {asxGetClientSkip, asxGetStartTime, asxGetDuration}) {
                add(std::to_string(get()));
            }
            add(std::to_string(asxIsEndofRepeat()));
        }
        for (unsigned n = 1; !asxGetParamName(index, n).empty(); ++n) {
            add(asxGetParamName(index, n));
        }
    }
    asxSetCurrentClipIndex(1);
    return all;
}

class AsxRandom : public Asx {
protected:
    void forEachText(int texts, const std::function<void(const std::string&)>& check) {
        const unsigned seed = std::random_device()();
        std::mt19937 random(seed);
        for (int i = 0; i < texts && !HasFailure(); ++i) {
            const std::string text = randomText(random);
            SCOPED_TRACE("seed " + std::to_string(seed) + ", text: " + text);
            SetUp();
            check(text);
        }
    }
};

TEST_F(AsxRandom, ListIsWalkedFromEndToEnd) {
    forEachText(2000, [](const std::string& text) {
        parse(text);
        const unsigned count = asxGetClipCount();
        EXPECT_EQ(asxGetCurrentClipIndex(), count == 0 ? 0u : 1u);
        for (unsigned index = 2; index <= count; ++index) {
            EXPECT_EQ(asxNextClip(), index);
        }
        EXPECT_EQ(asxNextClip(), 0u);
        for (unsigned index = count; index > 1; --index) {
            EXPECT_EQ(asxPrevClip(), index - 1);
        }
        EXPECT_EQ(asxPrevClip(), 0u);
        EXPECT_EQ(asxSetCurrentClipIndex(count + 1), 0);
        EXPECT_EQ(asxGetCurrentClipIndex(), count == 0 ? 0u : 1u);
    });
}

TEST_F(AsxRandom, PlayEndsAtTheLastClipOrRepeatsWithoutEnd) {
    forEachText(2000, [](const std::string& text) {
        parse(text);
        const size_t limit = 500;
        const Order order = playOrder(limit);
        if (asxGetClipCount() == 0) {
            EXPECT_TRUE(order.empty());
        } else if (order.size() < limit) {
            EXPECT_EQ(order.back(), asxGetClipCount());
        } else {
            EXPECT_NE(text.find("</Repeat>"), std::string::npos);
        }
    });
}

TEST_F(AsxRandom, SameTextGivesTheSameList) {
    forEachText(2000, [this](const std::string& text) {
        parse(text);
        const std::string first = contents();
        SetUp();
        parse(text);
        EXPECT_EQ(contents(), first);
    });
}

TEST_F(AsxRandom, CaseOfLettersChangesOnlyTheTexts) {
    const auto lower = [](std::string text) {
        for (char& c : text) {
            c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
        }
        return text;
    };
    forEachText(2000, [&](const std::string& text) {
        parse(text);
        const std::string original = contents();
        SetUp();
        parse(lower(text));
        EXPECT_EQ(contents(), lower(original));
    });
}

TEST_F(AsxRandom, WhatStandsBeforeTheListChangesNothing) {
    forEachText(2000, [this](const std::string& text) {
        parse(text);
        const std::string alone = contents();
        SetUp();
        parse("<Entry><Ref HREF=\"http://no\"/></Entry><TITLE>no</TITLE><AS X>::" + text);
        EXPECT_EQ(contents(), alone);
    });
}

TEST_F(AsxRandom, TextCutOffAnywhereGivesNoMoreClips) {
    forEachText(200, [](const std::string& text) {
        unsigned clips = 0;
        for (size_t length = 0; length <= text.size(); ++length) {
            parse(text.substr(0, length));
            EXPECT_GE(asxGetClipCount(), clips) << length;
            clips = asxGetClipCount();
        }
    });
}

} // namespace
