// Values across the script boundary (numbers, strings, identifiers, UTF-8) and the scripts that the plug-in
// has the page evaluate. All functions are stateless. Those that take or give browser values run on the
// browser thread.
#ifndef TELIX_COMMON_PLUGINUTILS_H
#define TELIX_COMMON_PLUGINUTILS_H

#include <cassert>
#include <cstdint>
#include <string>

#include "npapi/npruntime.h"

// A copy with the bytes "A" to "Z" in lower case; all other bytes, those above 127 included, stay.
std::string toLower(const std::string& text);

// The script string as a string, up to its first zero byte.
std::string stringValue(const NPString& text);

// Whether the variant is a number (int32 or double).
bool isNumberValue(const NPVariant& value);

// The number of an int32 or double variant, 0 for any other.
double numberValue(const NPVariant& value);

// A script number as a 32-bit integer: truncated, saturating at the bounds of the type, 0 for not-a-number.
int32_t toInt32(double number);
uint32_t toUint32(double number);

// The array index that a property name stands for, or -1. Only the first character is tested for a digit, so
// the name "2x" is index 2.
int getIntFromNPIdentifier(const NPIdentifier& id);

// Whether a value is one of the control characters that have an escape letter (7 to 13).
bool isEscapeCharacter(unsigned int value);

enum ESC_CHAR_ENUM_T {
    ESC_CHAR_ALERT = 7,
    ESC_CHAR_BACKSPACE = 8,
    ESC_CHAR_TAB = 9,
    ESC_CHAR_NEW_LINE = 10,
    ESC_CHAR_VERTICAL_TAB = 11,
    ESC_CHAR_FORM_FEED = 12,
    ESC_CHAR_CARRIAGE_RETURN = 13
};

// The escape as the page reads it in a string literal: a backslash and a letter, or nothing for any other
// value.
std::string getEscapeChar(ESC_CHAR_ENUM_T value);

inline bool isASCIIHexDigit(char c) {
    const char lower = static_cast<char>(c | 0x20);
    return (c >= '0' && c <= '9') || (lower >= 'a' && lower <= 'f');
}

// The value of a hex digit; any other byte is a programming fault.
inline int toASCIIHexValue(char c) {
    assert(isASCIIHexDigit(c));
    return c < 'A' ? c - '0' : (c - 'A' + 10) & 0xF;
}

// The length of the UTF-8 sequence that a first byte announces; 0 if the byte begins none.
int inlineUTF8SequenceLengthNonASCII(char first);
int inlineUTF8SequenceLength(char first);

enum ConversionResult { conversionOK = 0, sourceExhausted = 1, targetExhausted = 2, sourceIllegal = 3 };

// UTF-8 (RFC 3629) to UTF-16 units. Both start pointers are left at the first byte and unit not consumed.
// `strict` refuses what is not a character instead of writing U+FFFD for it.
ConversionResult convUTF8ToUTF16(const char** sourceStart, const char* sourceEnd,
                                 unsigned short** targetStart, unsigned short* targetEnd, int strict);

// A script string whose characters stand for bytes, as those bytes: a character above U+00FF gives its high
// byte, then its low one. Returns a zero-terminated block that the caller frees with free(), and its length
// without the zero; or null, with `length` untouched, if the string isn't UTF-8 or memory ran out.
unsigned char* utf8ToUtf16Converter(const NPString& text, unsigned int* length);

// What stands for a string of platform or page in a literal of a page script, single or double quoted.
// Without the environment variable PLUGIN_ESCAPE_EVENTS, or if it is empty or "0": the string as it is, so
// that a quote in it ends the literal. Else: escaped for ECMAScript, U+2028 and U+2029 too, and every byte
// that is not part of a UTF-8 sequence replaced by U+FFFD. Browser thread.
std::string literalText(const std::string& text);

// Page scripts. Strings go in as literalText() gives them.

// Dispatches a plain DOM event at the element; yields the boolean result of dispatchEvent. Neither string may
// be empty.
std::string domEventScript(const std::string& id, const std::string& event, bool bubbles, bool cancelable);

// Dispatches a "StreamEvent" with the properties name, data, text and status at the element.
std::string streamEventScript(const std::string& name, const std::string& data, const std::string& status,
                              const std::string& id);

// A hexadecimal string as its characters, control characters as their escapes.
std::string parseDataAsUTF8(const std::string& data);

// Fetches a stream event description and calls the element's addStreamEventListener (or
// removeStreamEventListener) with what it found. Works asynchronously and yields no boolean.
std::string parseStreamEventXMLScript(const std::string& url, const std::string& eventName,
                                      const std::string& id, bool isAdd);

// Defines window.getPlayCountVal, which returns the value of the element's first `param` child.
std::string getPlayCountVal(const std::string& id);

// Defines window.getEncodedURL, which returns the URL, URI-encoded.
std::string getEncodedURL(const std::string& url);

#endif
