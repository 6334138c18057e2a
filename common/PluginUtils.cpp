// Conversion of script values, the UTF-8 machinery behind the one place where a script string stands for
// bytes, and the page scripts. The scripts are fixed, inconsistencies included: pages on sets in the
// field rely on them.
#include "common/PluginUtils.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <limits>

#include <glib.h>

#include "common/BrowserGates.h"
#include "common/Log.h"
#include "common/PageScripts.h"

std::string toLower(const std::string& text) {
    std::string result = text;
    for (char& c : result) {
        if (c >= 'A' && c <= 'Z') {
            c = static_cast<char>(c + 32);
        }
    }
    return result;
}

std::string stringValue(const NPString& text) {
    std::string result;
    if (text.UTF8Length > 0) {
        result.assign(text.UTF8Characters, strnlen(text.UTF8Characters, text.UTF8Length));
    }
    PLUGIN_LOG(COMMON, "In stringValue() function, string is: %s. \n", result.c_str());
    return result;
}

bool isNumberValue(const NPVariant& value) {
    return value.type == NPVariantType_Int32 || value.type == NPVariantType_Double;
}

double numberValue(const NPVariant& value) {
    switch (value.type) {
    case NPVariantType_Int32:
        return value.value.intValue;
    case NPVariantType_Double:
        return value.value.doubleValue;
    default:
        return 0;
    }
}

namespace {

// quirk 5: a number beyond the range takes the nearest bound instead of wrapping.
template <typename Integer>
Integer saturate(double number) {
    if (std::isnan(number)) {
        return 0;
    }
    constexpr double kLowest = std::numeric_limits<Integer>::min();
    constexpr double kHighest = std::numeric_limits<Integer>::max();
    return static_cast<Integer>(std::clamp(number, kLowest, kHighest));
}

} // namespace

int32_t toInt32(double number) {
    return saturate<int32_t>(number);
}

uint32_t toUint32(double number) {
    return saturate<uint32_t>(number);
}

int getIntFromNPIdentifier(const NPIdentifier& id) {
    int result = -1;
    char* name = NPN_UTF8FromIdentifier(id);
    if (!name) {
        return result;
    }
    PLUGIN_LOG(COMMON, "Property name:-- %s --\n", name);
    // quirk 6: only the first character is tested.
    if (name[0] >= '0' && name[0] <= '9') {
        result = std::atoi(name);
    }
    // free() and not NPN_MemFree: the browsers of the sets hand these strings out from the C heap.
    std::free(name);
    return result;
}

bool isEscapeCharacter(unsigned int value) {
    return value >= ESC_CHAR_ALERT && value <= ESC_CHAR_CARRIAGE_RETURN;
}

std::string getEscapeChar(ESC_CHAR_ENUM_T value) {
    static const char kLetters[] = "abtnvfr";
    if (!isEscapeCharacter(value)) {
        return {};
    }
    return {'\\', kLetters[value - ESC_CHAR_ALERT]};
}

int inlineUTF8SequenceLengthNonASCII(char first) {
    const auto byte = static_cast<unsigned char>(first);
    if ((byte & 0xE0) == 0xC0) {
        return 2;
    }
    if ((byte & 0xF0) == 0xE0) {
        return 3;
    }
    if ((byte & 0xF8) == 0xF0) {
        return 4;
    }
    return 0;
}

int inlineUTF8SequenceLength(char first) {
    return (static_cast<unsigned char>(first) & 0x80) ? inlineUTF8SequenceLengthNonASCII(first) : 1;
}

namespace {

bool isContinuation(unsigned char byte) {
    return byte >= 0x80 && byte <= 0xBF;
}

// The well-formed byte sequences of RFC 3629, section 4.
bool isLegalUTF8Sequence(const char* bytes, int length) {
    const auto byteAt = [bytes](int index) { return static_cast<unsigned char>(bytes[index]); };
    if (length < 1 || length > 4) {
        return false;
    }
    if (length == 4 && !isContinuation(byteAt(3))) {
        return false;
    }
    if (length >= 3 && !isContinuation(byteAt(2))) {
        return false;
    }
    const unsigned char first = byteAt(0);
    if (length >= 2) {
        const unsigned char second = byteAt(1);
        unsigned char lowest = 0x80;
        unsigned char highest = 0xBF;
        switch (first) {
        case 0xE0:
            lowest = 0xA0;
            break;
        case 0xED:
            highest = 0x9F;
            break;
        case 0xF0:
            lowest = 0x90;
            break;
        case 0xF4:
            highest = 0x8F;
            break;
        default:
            break;
        }
        if (second < lowest || second > highest) {
            return false;
        }
    }
    return (first < 0x80 || first > 0xC1) && first <= 0xF4;
}

// Decodes one sequence: all bytes summed up in base 64, then the sum of their marker bits taken off.
uint32_t readUTF8Sequence(const char** source, int length) {
    static const uint32_t kMarkers[] = {0, 0, 0x3080, 0xE2080, 0x3C82080, 0xFA082080, 0x82082080};
    if (length < 1 || length > 6) {
        return 0;
    }
    uint32_t value = 0;
    for (int i = 0; i < length; ++i) {
        value = value * 64 + static_cast<unsigned char>(*(*source)++);
    }
    return value - kMarkers[length];
}

} // namespace

ConversionResult convUTF8ToUTF16(const char** sourceStart, const char* sourceEnd,
                                 unsigned short** targetStart, unsigned short* targetEnd, int strict) {
    constexpr unsigned short kReplacement = 0xFFFD;
    ConversionResult result = conversionOK;
    const char* source = *sourceStart;
    unsigned short* target = *targetStart;
    while (source < sourceEnd) {
        const int length = inlineUTF8SequenceLength(*source);
        if (sourceEnd - source < length) {
            result = sourceExhausted;
            break;
        }
        if (!isLegalUTF8Sequence(source, length)) {
            result = sourceIllegal;
            break;
        }
        const uint32_t character = readUTF8Sequence(&source, length);
        const bool isPair = character >= 0x10000 && character <= 0x10FFFF;
        if (targetEnd - target < (isPair ? 2 : 1)) {
            source -= length;
            result = targetExhausted;
            break;
        }
        const bool isNone = (character >= 0xD800 && character <= 0xDFFF) || character > 0x10FFFF;
        if (isNone && strict) {
            source -= length;
            result = sourceIllegal;
            break;
        }
        if (isPair) {
            *target++ = static_cast<unsigned short>((character >> 10) + 0xD7C0);
            *target++ = static_cast<unsigned short>((character & 0x3FF) | 0xDC00);
        } else {
            *target++ = isNone ? kReplacement : static_cast<unsigned short>(character);
        }
    }
    *sourceStart = source;
    *targetStart = target;
    return result;
}

unsigned char* utf8ToUtf16Converter(const NPString& text, unsigned int* length) {
    PLUGIN_LOG(COMMON, " called \n");
    // A UTF-8 sequence never gives more units than it has bytes, and never more bytes than it had.
    const size_t longest = text.UTF8Length;
    if (longest > (SIZE_MAX - 1) / 2) {
        return nullptr;
    }
    auto* units = static_cast<unsigned short*>(std::malloc(2 * longest + 1));
    if (!units) {
        return nullptr;
    }
    const char* source = text.UTF8Characters;
    unsigned short* unitsEnd = units;
    const ConversionResult converted = convUTF8ToUTF16(&source, text.UTF8Characters + text.UTF8Length,
                                                       &unitsEnd, units + text.UTF8Length, 1);
    if (converted != conversionOK) {
        PLUGIN_LOG(COMMON, "convUTF8ToUTF16 failed[%d]\n", converted);
        std::free(units);
        return nullptr;
    }
    auto* bytes = static_cast<unsigned char*>(std::malloc(static_cast<size_t>(text.UTF8Length) + 1));
    if (!bytes) {
        std::free(units);
        return nullptr;
    }
    PLUGIN_LOG(COMMON, "Result after conversion from convertUTF8ToUTF16 \n");
    unsigned int count = 0;
    for (const unsigned short* unit = units; unit != unitsEnd; ++unit) {
        if (*unit >> 8) {
            bytes[count++] = static_cast<unsigned char>(*unit >> 8);
        }
        bytes[count++] = static_cast<unsigned char>(*unit & 0xFF);
    }
    bytes[count] = 0;
    std::free(units);
    PLUGIN_LOG(COMMON, "Resultant String passed to IF API\n");
    for (unsigned int i = 0; i < count; ++i) {
        PLUGIN_LOG(COMMON, "%02x\n", bytes[i]);
    }
    *length = count;
    return bytes;
}

namespace {

bool escapesEvents() {
    const char* value = std::getenv("PLUGIN_ESCAPE_EVENTS");
    return value && *value && std::strcmp(value, "0") != 0;
}

// With U+FFFD for every byte that is not part of a UTF-8 sequence.
std::string validUTF8(const std::string& text) {
    std::string result;
    const char* from = text.data();
    const char* const end = from + text.size();
    while (from < end) {
        const char* invalid = nullptr;
        g_utf8_validate(from, end - from, &invalid);
        result.append(from, invalid);
        from = invalid;
        if (from < end) {
            result += "\xEF\xBF\xBD";
            ++from;
        }
    }
    return result;
}

std::string escapedForLiteral(const std::string& text) {
    std::string result;
    const std::string valid = validUTF8(text);
    for (size_t i = 0; i < valid.size(); ++i) {
        const auto c = static_cast<unsigned char>(valid[i]);
        const bool isSeparator =
            valid.compare(i, 3, "\xE2\x80\xA8") == 0 || valid.compare(i, 3, "\xE2\x80\xA9") == 0;
        if (c == '\\' || c == '"' || c == '\'') {
            result += {'\\', static_cast<char>(c)};
        } else if (c < 0x20 || c == 0x7F) {
            char escape[sizeof("\\x00")];
            std::snprintf(escape, sizeof(escape), "\\x%02x", c);
            result += escape;
        } else if (isSeparator) {
            i += 2;
            result += valid[i] == '\xA8' ? "\\u2028" : "\\u2029";
        } else {
            result += static_cast<char>(c);
        }
    }
    return result;
}

} // namespace

std::string literalText(const std::string& text) {
    return escapesEvents() ? escapedForLiteral(text) : text;
}

// quirk 10: the event gets no properties.
// quirk 12: `objElement` and `newEvent` become globals of the page.
std::string domEventScript(const std::string& id, const std::string& event, bool bubbles, bool cancelable) {
    PLUGIN_LOG(COMMON, "Id: %s , Event: %s \n", id.c_str(), event.c_str());
    assert(!id.empty());
    assert(!event.empty());
    std::string script = "var objElement=document.getElementById(\"";
    script += literalText(id);
    script += "\"); newEvent=document.createEvent(\"Event\");"
              "newEvent.initEvent(\"";
    script += literalText(event);
    script += "\", ";
    script += bubbles ? "true" : "false";
    script += ",";
    script += cancelable ? "true" : "false";
    script += "); objElement.dispatchEvent(newEvent);";
    return script;
}

namespace {

// The bytes that a hexadecimal string stands for, but those of value zero.
std::string payloadBytes(const std::string& data) {
    PLUGIN_LOG_FOR(LogModule::COMMON, "parseDataAsUTF8", "Data val is: %s \n", data.c_str());
    std::string result;
    for (size_t index = 0; index < data.size(); index += 2) {
        unsigned int value = 0;
        // The terminating zero ends a pair that is cut short: it is not a hex digit.
        for (size_t taken = 0; taken < 2 && isASCIIHexDigit(data.c_str()[index + taken]); ++taken) {
            value = value << 4 | static_cast<unsigned int>(toASCIIHexValue(data[index + taken]));
        }
        if (value != 0) {
            result += static_cast<char>(value);
        }
    }
    return result;
}

} // namespace

std::string parseDataAsUTF8(const std::string& data) {
    std::string result;
    for (const char c : payloadBytes(data)) {
        const auto value = static_cast<unsigned char>(c);
        if (isEscapeCharacter(value)) {
            result += getEscapeChar(static_cast<ESC_CHAR_ENUM_T>(value));
        } else {
            result += c;
        }
    }
    return result;
}

// quirk 11: unless PLUGIN_ESCAPE_EVENTS is set, a quote in an argument or in the payload ends the string
// literal, and the script fails.
std::string streamEventScript(const std::string& name, const std::string& data, const std::string& status,
                              const std::string& id) {
    PLUGIN_LOG(COMMON, "is called. Name: %s , Data: %s , Status: %s , Id:  %s \n", name.c_str(), data.c_str(),
               status.c_str(), id.c_str());
    std::string script = "var objElement = document.getElementById(\"";
    script += literalText(id);
    script += "\"); "
              "var strEvent = document.createEvent('Event'); "
              "strEvent.initEvent('StreamEvent', false, false); "
              "strEvent.name = \"";
    script += literalText(name);
    script += "\"; strEvent.data = \"";
    script += literalText(data);
    script += "\"; ";
    const std::string text = escapesEvents() ? escapedForLiteral(payloadBytes(data)) : parseDataAsUTF8(data);
    if (!text.empty()) {
        script += " strEvent.text = \"";
        script += text;
        script += "\"; ";
    }
    script += " strEvent.status = \"";
    script += literalText(status);
    script += "\"; "
              "objElement.dispatchEvent(strEvent);";
    PLUGIN_LOG(COMMON, "Script: %s \n", script.c_str());
    return script;
}

std::string parseStreamEventXMLScript(const std::string& url, const std::string& eventName,
                                      const std::string& id, bool isAdd) {
    std::string script =
        fillIn(kStreamEventRequestScript, {literalText(url), literalText(eventName), literalText(id),
                                           isAdd ? "addStreamEventListener" : "removeStreamEventListener"});
    PLUGIN_LOG(COMMON, "Script: %s \n", script.c_str());
    return script;
}

std::string getPlayCountVal(const std::string& id) {
    std::string script = fillIn(kPlayCountScript, {literalText(id)});
    PLUGIN_LOG(COMMON, "Script:--  %s ----\n", script.c_str());
    return script;
}

std::string getEncodedURL(const std::string& url) {
    std::string script = fillIn(kEncodedUrlScript, {literalText(url)});
    PLUGIN_LOG(COMMON, "Script:--  %s ----\n", script.c_str());
    return script;
}
