// Conversions between the engine's UTF-16 and the plug-in's UTF-8. What cannot be converted is replaced by
// U+FFFD, so that neither side ever sees an invalid string. Stateless; any thread.
#ifndef TELIX_BRIDGE_TEXT_H
#define TELIX_BRIDGE_TEXT_H

#include <string>
#include <string_view>

namespace bridge {

// Lone surrogates are replaced.
std::string utf8From(std::u16string_view text);
// Bytes that are part of no valid sequence are replaced one by one. Zeros are characters like others.
std::u16string utf16From(std::string_view text);

} // namespace bridge

#endif
