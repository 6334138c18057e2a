// The playlist scanner and the list that it fills. This is not an XML parser: it looks for a fixed set of tag
// beginnings and takes nearly anything in between, as players of these lists always have. The position of the
// scan only ever moves forwards, which keeps a parse linear in the length of the string.
#include "src/avcontrol/Asx.h"

#include <algorithm>
#include <cstdint>
#include <cstring>
#include <deque>
#include <string_view>
#include <utility>
#include <vector>

#include "common/Log.h"

namespace {

// The strings of parameters and clips are views of the playlist, which the list keeps: a clip is read without
// an allocation for each of its strings. A URL is joined with its base when it is asked for, since a long
// base before many URLs would take memory by the square of the playlist.
struct AsxParam {
    std::string_view name;
    std::string_view value;
};

struct AsxEntry {
    uint32_t index = 0;
    uint8_t clientSkip = 0;
    uint32_t startTime = 0;
    uint32_t duration = 0;
    std::string_view baseUrl;
    std::string_view joinedBase; // goes before the URL
    std::string_view fileName;
    std::string_view title;
    std::string_view author;
    std::string_view copyright;
    std::string_view rating;
    std::string_view description;
    std::vector<AsxParam> params;
};

struct AsxData {
    uint32_t clipCount = 0;
    std::string inheritedBase; // of the list before
    std::string_view baseUrl;  // of this list, or the inherited one
    std::string fileName;
    std::string title;
    std::string author;
    std::string copyright;
    std::string rating;
    std::string description;
    uint32_t repeatStart = 0;
    uint32_t repeatEnd = 0;
    int32_t repeatCount = 0; // -1 is without end, 0 none
    uint32_t repeatPass = 1;
    AsxEntry* currentClip = nullptr;
    std::vector<AsxParam> params;
    std::deque<AsxEntry> entries; // the clip with the index i stands at i - 1
    AsxText text;
};

// quirk 70: one record for the process.
AsxData s_asxData;

char lowerCase(char c) {
    return c >= 'A' && c <= 'Z' ? static_cast<char>(c + 32) : c;
}

constexpr size_t kNpos = std::string_view::npos;
constexpr std::string_view kBlanks = "\t\n\r ";

// Whether `lower`, which is in lower case, stands at `at`, a position in the string or its end.
bool standsAt(std::string_view text, size_t at, std::string_view lower) {
    return text.size() - at >= lower.size() &&
           std::equal(lower.begin(), lower.end(), text.begin() + at,
                      [](char wanted, char c) { return lowerCase(c) == wanted; });
}

// The next position at which the tag beginning `lower` stands, or kNpos.
size_t searchTag(std::string_view text, size_t from, std::string_view lower) {
    size_t at = text.find('<', from);
    while (at != kNpos && !standsAt(text, at, lower)) {
        at = text.find('<', at + 1);
    }
    return at;
}

// The number that the string begins with. One too large gives 0 when it shows by getting smaller; one that
// wraps to something larger passes.
uint32_t parseNumber(std::string_view text) {
    uint32_t value = 0;
    for (size_t at = text.find_first_not_of(kBlanks); at < text.size(); ++at) {
        const char c = text[at];
        if (c < '0' || c > '9') {
            break;
        }
        const uint32_t next = value * 10 + static_cast<uint32_t>(c - '0');
        if (static_cast<int32_t>(next) < static_cast<int32_t>(value)) {
            return 0;
        }
        value = next;
    }
    return value;
}

// The next colon from positions that never go back. The last hit is remembered, so that all the searches of a
// parse together read the string once.
class ColonSearch {
public:
    explicit ColonSearch(std::string_view text) : m_text(text), m_hit(text.find(':')) {}

    size_t from(size_t at) {
        if (m_hit < at) {
            m_hit = m_text.find(':', at);
        }
        return m_hit;
    }

private:
    std::string_view m_text;
    size_t m_hit; // kNpos, which is after any position, if no colon follows
};

// One parse. A search that fails leaves the position at kNpos, and the scan ends there with what it has read.
class AsxScanner {
public:
    explicit AsxScanner(std::string_view text) : m_text(text), m_firstColon(text), m_secondColon(text) {}

    // Moves to the start of the playlist; false if there is none.
    bool findStart() {
        m_at = searchTag(m_text, 0, "<asx");
        return m_at != kNpos;
    }

    // Reads the clips and returns their number.
    uint32_t scan() {
        search('>');
        while (m_at != kNpos && search('<')) {
            readTag();
        }
        return m_count;
    }

private:
    bool search(char c) {
        m_at = m_text.find(c, m_at);
        return m_at != kNpos;
    }

    void pass(std::string_view token) {
        m_at = m_text.find(token, m_at);
        if (m_at != kNpos) {
            m_at += token.size();
        }
    }

    bool passPrefix(std::string_view lower) {
        if (!standsAt(m_text, m_at, lower)) {
            return false;
        }
        m_at += lower.size();
        return true;
    }

    // Whether the tag's next attribute is `lower`, of which only these letters are compared.
    bool atAttribute(std::string_view lower) {
        m_at = std::min(m_text.find_first_not_of(kBlanks, m_at), m_text.size());
        return standsAt(m_text, m_at, lower);
    }

    // The string between the next two double quotes; leaves the position at the second.
    bool readQuoted(std::string_view& value) {
        if (!search('"')) {
            return false;
        }
        const size_t start = ++m_at;
        if (!search('"')) {
            return false;
        }
        value = m_text.substr(start, m_at - start);
        return true;
    }

    void readTag();
    void readText(std::string_view closingTag, std::string_view AsxEntry::*ofEntry,
                  std::string AsxData::*ofList);
    void readParam();
    void readBase();
    void readRepeat();
    void readRepeatEnd();
    void readEntry();
    void readRef();
    void readTime(uint32_t AsxEntry::*field, const char* outsideMessage);
    void readEntryEnd();
    uint32_t parseTime(std::string_view value);

    std::string_view m_text;
    size_t m_at = 0;
    AsxEntry* m_entry = nullptr; // the open one
    uint32_t m_count = 0;
    int32_t m_pendingRepeat = 0;
    bool m_repeatOpened = false;
    std::string_view m_lastHref;
    std::string_view m_joinedBase;
    std::string_view m_joinedHref;
    ColonSearch m_firstColon;
    ColonSearch m_secondColon;
};

#define ASX_PARSE_LOG(...) PLUGIN_LOG_FOR(LogModule::AVCONTROL, "asxParseAsx", __VA_ARGS__)

void AsxScanner::readTag() {
    if (passPrefix("<param ")) {
        readParam();
    } else if (passPrefix("<base ")) {
        readBase();
    } else if (passPrefix("<title>")) {
        readText("</title>", &AsxEntry::title, &AsxData::title);
    } else if (passPrefix("<author>")) {
        readText("</author>", &AsxEntry::author, &AsxData::author);
    } else if (passPrefix("<copyright>")) {
        readText("</copyright>", &AsxEntry::copyright, &AsxData::copyright);
    } else if (passPrefix("<abstract>")) {
        readText("</abstract>", &AsxEntry::description, &AsxData::description);
        // quirk 74: nothing parts these two from longer names.
    } else if (passPrefix("<repeat")) {
        readRepeat();
    } else if (passPrefix("</repeat>")) {
        readRepeatEnd();
    } else if (passPrefix("<entry")) {
        readEntry();
    } else if (passPrefix("<ref ")) {
        readRef();
    } else if (passPrefix("<starttime ")) {
        readTime(&AsxEntry::startTime, "starttime outside an entry section");
    } else if (passPrefix("<duration ")) {
        readTime(&AsxEntry::duration, "duration outside an entry section");
    } else if (passPrefix("</entry>")) {
        readEntryEnd();
    } else if (standsAt(m_text, m_at, "</asx")) {
        ++m_at; // what follows the end is read all the same
        ASX_PARSE_LOG("ASX length = %ld", static_cast<long>(m_at));
    } else if (standsAt(m_text, m_at, "<!--")) {
        pass("-->");
    } else {
        ++m_at;
    }
}

void AsxScanner::readText(std::string_view closingTag, std::string_view AsxEntry::*ofEntry,
                          std::string AsxData::*ofList) {
    const size_t start = m_at;
    m_at = searchTag(m_text, m_at, closingTag);
    if (m_at == kNpos) {
        return;
    }
    const std::string_view text = m_text.substr(start, m_at - start);
    if (m_entry) {
        m_entry->*ofEntry = text;
    } else {
        s_asxData.*ofList = text;
    }
    m_at += closingTag.size();
}

void AsxScanner::readParam() {
    AsxParam* param = nullptr;
    std::string_view text;
    if (atAttribute("name")) {
        if (!readQuoted(text) || text.empty()) {
            return;
        }
        std::vector<AsxParam>& params = m_entry ? m_entry->params : s_asxData.params;
        param = &params.emplace_back(AsxParam{text, {}});
    }
    // Past the closing quote. A tag without a name loses a character of its own, so "<PARAM />" doesn't close
    // itself.
    m_at = std::min(m_at + 1, m_text.size());
    if (atAttribute("value")) {
        if (!readQuoted(text) || text.empty() || !param) {
            return;
        }
        param->value = text;
    }
    pass("/>");
}

void AsxScanner::readBase() {
    if (atAttribute("href")) {
        std::string_view url;
        if (!readQuoted(url)) {
            return;
        }
        if (m_entry) {
            m_entry->baseUrl = url;
        } else {
            s_asxData.baseUrl = url;
        }
    }
    // quirk 74: a tag closed by ">" alone hides all up to the next "/>".
    pass("/>");
}

void AsxScanner::readRepeat() {
    const bool counted = atAttribute("count");
    if (m_pendingRepeat != 0 || m_repeatOpened) {
        ASX_PARSE_LOG("We already are in an repeat section");
        return;
    }
    m_repeatOpened = true;
    if (counted) {
        std::string_view count;
        if (!readQuoted(count) || count.empty()) {
            return;
        }
        m_pendingRepeat = static_cast<int32_t>(parseNumber(count));
    } else {
        m_pendingRepeat = -1;
    }
    pass(">");
}

// quirk 72: the section stays marked as opened; a second one is refused, and its end makes the first endless.
void AsxScanner::readRepeatEnd() {
    if (!m_repeatOpened) {
        ASX_PARSE_LOG("end of repeat without start");
        return;
    }
    if (m_pendingRepeat != 0 && s_asxData.repeatEnd == 0) {
        s_asxData.repeatEnd = m_count;
    }
    s_asxData.repeatCount = m_pendingRepeat;
    m_pendingRepeat = 0;
}

void AsxScanner::readEntry() {
    if (m_entry) {
        ASX_PARSE_LOG("We already are in an entry section");
        return;
    }
    const size_t start = m_at;
    if (!search('>')) {
        return;
    }
    // Only within the tag, so that not each clip searches the whole string.
    const std::string_view attributes = m_text.substr(start, m_at - start);
    constexpr std::string_view kNoSkip = "clientskip=\"no\"";
    const bool skips =
        std::search(attributes.begin(), attributes.end(), kNoSkip.begin(), kNoSkip.end(),
                    [](char c, char wanted) { return lowerCase(c) == wanted; }) == attributes.end();
    m_entry = &s_asxData.entries.emplace_back();
    m_entry->index = ++m_count;
    m_entry->clientSkip = skips ? 1 : 0;
    if (m_pendingRepeat != 0 && s_asxData.repeatStart == 0) {
        s_asxData.repeatStart = m_entry->index;
    }
}

void AsxScanner::readRef() {
    const bool addressed = atAttribute("href");
    if (!m_entry) {
        ASX_PARSE_LOG("A ref outside an entry section");
        return;
    }
    if (addressed) {
        std::string_view href;
        if (!readQuoted(href)) {
            return;
        }
        href.remove_prefix(std::min(href.find_first_not_of(kBlanks), href.size()));
        if (href.empty()) {
            return;
        }
        m_entry->fileName = href;
        m_lastHref = href;
        // quirk 73: the base goes before any URL, and a later entry under no base at all gets the joined one
        // again.
        const std::string_view base = m_entry->baseUrl.empty() ? s_asxData.baseUrl : m_entry->baseUrl;
        if (!base.empty()) {
            m_joinedBase = base;
            m_joinedHref = href;
        }
        if (!m_joinedHref.empty()) {
            m_entry->joinedBase = m_joinedBase;
            m_entry->fileName = m_joinedHref;
        }
    }
    pass(">");
}

void AsxScanner::readTime(uint32_t AsxEntry::*field, const char* outsideMessage) {
    const bool valued = atAttribute("value");
    if (!m_entry) {
        ASX_PARSE_LOG("%s", outsideMessage);
        return;
    }
    if (valued) {
        std::string_view value;
        if (!readQuoted(value) || value.empty()) {
            return;
        }
        m_entry->*field = parseTime(value);
    }
    pass(">");
}

// Any URL closes the entry, one of an earlier entry too.
void AsxScanner::readEntryEnd() {
    if (!m_entry) {
        ASX_PARSE_LOG("end of entry without start?");
    } else if (m_lastHref.empty()) {
        ASX_PARSE_LOG("entry without href?");
    } else {
        m_entry = nullptr;
    }
}

// Seconds, or minutes and seconds, or hours, minutes and seconds, into seconds.
// quirk 71: colons count wherever in the playlist they follow; "30" before one is 30 minutes.
uint32_t AsxScanner::parseTime(std::string_view value) {
    const auto start = static_cast<size_t>(value.data() - m_text.data());
    const size_t end = start + value.size();
    const auto numberAfter = [&](size_t colon) {
        return colon < end ? parseNumber(m_text.substr(colon + 1, end - (colon + 1))) : 0;
    };
    const uint32_t first = parseNumber(value);
    size_t colon = m_firstColon.from(start);
    if (colon == kNpos) {
        return first;
    }
    const uint32_t second = numberAfter(colon);
    colon = m_secondColon.from(colon + 1);
    if (colon == kNpos) {
        return first * 60 + second;
    }
    return (first * 60 + second) * 60 + numberAfter(colon);
}

#define ASX_PRINT_LOG(...) PLUGIN_LOG_FOR(LogModule::AVCONTROL, "asxPrintAsxData", __VA_ARGS__)

std::string urlOf(const AsxEntry& clip) {
    const std::string path(clip.fileName);
    return clip.joinedBase.empty() ? path : asxAppendBaseUrl(std::string(clip.joinedBase), path);
}

// The strings that the list as a whole and a clip have in common.
template <class Record>
void logTexts(const Record& record, const std::string& fileName) {
    ASX_PRINT_LOG("ASX File Name: %s", fileName.c_str());
    ASX_PRINT_LOG("ASX Title: %s", std::string(record.title).c_str());
    ASX_PRINT_LOG("ASX Author: %s", std::string(record.author).c_str());
    ASX_PRINT_LOG("ASX CopyRight: %s", std::string(record.copyright).c_str());
    ASX_PRINT_LOG("ASX Rating: %s", std::string(record.rating).c_str());
    ASX_PRINT_LOG("ASX Description: %s", std::string(record.description).c_str());
}

void logParams(const std::vector<AsxParam>& params) {
    for (const AsxParam& param : params) {
        ASX_PRINT_LOG("ASX Param: %s = %s", std::string(param.name).c_str(),
                      std::string(param.value).c_str());
    }
}

void logClip(const AsxEntry& clip) {
    ASX_PRINT_LOG("ASX Clip - %d", clip.index);
    logTexts(clip, urlOf(clip));
    ASX_PRINT_LOG("ASX ClientSkip: %d", clip.clientSkip);
    ASX_PRINT_LOG("ASX Start time: %d", clip.startTime);
    ASX_PRINT_LOG("ASX Duration: %d", clip.duration);
    logParams(clip.params);
}

std::string ofCurrentClip(std::string_view AsxEntry::*field) {
    return std::string(s_asxData.currentClip ? s_asxData.currentClip->*field : std::string_view());
}

} // namespace

std::string asxIsAsxfile(const void* data, unsigned /*size*/) {
    const std::string_view text = data ? static_cast<const char*>(data) : "";
    return std::string(searchTag(text, 0, "<asx") != kNpos ? text : "");
}

int asxParseAsx(const char* text, const std::string& url) {
    return asxParseAsx(AsxText(strdup(text)), url);
}

int asxParseAsx(AsxText text, const std::string& url) {
    asxClear();
    s_asxData.fileName = url;
    s_asxData.text = std::move(text);
    AsxScanner scanner(s_asxData.text ? s_asxData.text.get() : "");
    if (scanner.findStart()) {
        s_asxData.clipCount = scanner.scan();
        asxSetCurrentClipIndex(1);
        if (s_asxData.clipCount == 0) {
            asxClear();
        }
    }
    return 0;
}

void asxClear() {
    s_asxData.currentClip = nullptr;
    s_asxData.clipCount = 0;
    s_asxData.entries.clear();
    s_asxData.params.clear();
    s_asxData.inheritedBase = std::string(s_asxData.baseUrl); // it outlives the text that it may stand in
    s_asxData.baseUrl = s_asxData.inheritedBase;
    s_asxData.text.reset();
    s_asxData.repeatStart = 0;
    s_asxData.repeatEnd = 0;
    s_asxData.repeatCount = 0;
    s_asxData.repeatPass = 1;
}

void asxPrintAsxData() {
    logTexts(s_asxData, s_asxData.fileName);
    logParams(s_asxData.params);
    ASX_PRINT_LOG("ASX Repeat: (%d)%d-%d", s_asxData.repeatCount, s_asxData.repeatStart, s_asxData.repeatEnd);
    if (!s_asxData.entries.empty()) {
        s_asxData.currentClip = &s_asxData.entries.front();
        do {
            logClip(*s_asxData.currentClip);
        } while (asxNextClip());
    }
    asxSetCurrentClipIndex(1);
    ASX_PRINT_LOG("ASX Total Clip Number: %d", s_asxData.clipCount);
}

std::string asxShowFileName() {
    return s_asxData.fileName;
}

std::string asxShowTitle() {
    return s_asxData.title;
}

std::string asxShowAuthor() {
    return s_asxData.author;
}

std::string asxShowCopyRight() {
    return s_asxData.copyright;
}

std::string asxShowRating() {
    return s_asxData.rating;
}

std::string asxShowDescription() {
    return s_asxData.description;
}

std::string asxShowClipFileName() {
    return s_asxData.currentClip ? urlOf(*s_asxData.currentClip) : std::string();
}

std::string asxShowClipTitle() {
    return ofCurrentClip(&AsxEntry::title);
}

std::string asxShowClipAuthor() {
    return ofCurrentClip(&AsxEntry::author);
}

std::string asxShowClipCopyRight() {
    return ofCurrentClip(&AsxEntry::copyright);
}

std::string asxShowClipRating() {
    return ofCurrentClip(&AsxEntry::rating);
}

std::string asxShowClipDescription() {
    return ofCurrentClip(&AsxEntry::description);
}

unsigned asxGetClientSkip() {
    return s_asxData.currentClip ? s_asxData.currentClip->clientSkip : 1;
}

unsigned asxGetStartTime() {
    return s_asxData.currentClip ? s_asxData.currentClip->startTime : 0;
}

unsigned asxGetDuration() {
    return s_asxData.currentClip ? s_asxData.currentClip->duration : 0;
}

unsigned asxGetClipCount() {
    return s_asxData.clipCount;
}

int asxSetCurrentClipIndex(unsigned index) {
    if (index > s_asxData.clipCount) {
        PLUGIN_LOG(AVCONTROL, "ASX error (i=%d, total=%d)", index, s_asxData.clipCount);
        return 0;
    }
    if (index == 0) {
        return 0;
    }
    s_asxData.currentClip = &s_asxData.entries[index - 1];
    return 1;
}

unsigned asxGetCurrentClipIndex() {
    return s_asxData.currentClip ? s_asxData.currentClip->index : 0;
}

unsigned asxNextClip() {
    const unsigned current = asxGetCurrentClipIndex();
    if (current == 0) {
        return 0;
    }
    if (current == s_asxData.clipCount) {
        PLUGIN_LOG(AVCONTROL, "ASX %s : last index (c=%d, t=%d)", __func__, current, s_asxData.clipCount);
        return 0;
    }
    s_asxData.currentClip = &s_asxData.entries[current];
    return current + 1;
}

unsigned asxPrevClip() {
    const unsigned current = asxGetCurrentClipIndex();
    if (current == 0) {
        return 0;
    }
    if (current == 1) {
        PLUGIN_LOG(AVCONTROL, "ASX %s : first index (c=%d, t=%d)", __func__, current, s_asxData.clipCount);
        return 0;
    }
    s_asxData.currentClip = &s_asxData.entries[current - 2];
    return current - 1;
}

int asxIsEndofRepeat() {
    if (!s_asxData.currentClip) {
        return 0;
    }
    if (s_asxData.repeatCount > 0 && s_asxData.repeatPass == static_cast<uint32_t>(s_asxData.repeatCount)) {
        return 0;
    }
    return s_asxData.currentClip->index == s_asxData.repeatEnd ? 1 : 0;
}

void asxGotoStartofRepeat() {
    if (s_asxData.repeatStart == 0) {
        return;
    }
    ++s_asxData.repeatPass;
    if (s_asxData.repeatStart != s_asxData.repeatEnd) {
        asxSetCurrentClipIndex(s_asxData.repeatStart);
    }
}

std::string asxGetParamName(unsigned index, unsigned n) {
    if (index > s_asxData.entries.size()) {
        return {};
    }
    const std::vector<AsxParam>& params = index == 0 ? s_asxData.params : s_asxData.entries[index - 1].params;
    return std::string(n >= 1 && n <= params.size() ? params[n - 1].name : std::string_view());
}

// Names are looked for in the head of a list, which has neither a name nor a value, and not in its elements.
// So no name leads to a value, and that is what callers have always been given.
std::string asxGetParam(unsigned /*index*/, const std::string& /*name*/) {
    return {};
}

std::string asxAppendBaseUrl(const std::string& base, const std::string& path) {
    if (base.empty() || path.empty()) {
        return {};
    }
    return base + (base.back() == '/' ? "" : "/") + path;
}
