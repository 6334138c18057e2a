// The longer page scripts, as an author of pages would write them, and how their arguments go in.
#ifndef TELIX_COMMON_PAGESCRIPTS_H
#define TELIX_COMMON_PAGESCRIPTS_H

#include <initializer_list>
#include <string>
#include <string_view>

// The script with the arguments in the places marked "@@", one for each in order and as they are, on one
// line: the line ends of a script are layout. Every other byte of it reaches the page, tabs and doubled
// blanks included.
std::string fillIn(std::string_view script, std::initializer_list<std::string_view> arguments);

// Arguments: the description's URL, the event's name, the element's id, the name of the element's method that
// takes what was found.
extern const std::string_view kStreamEventRequestScript;

// Argument: the element's id.
extern const std::string_view kPlayCountScript;

// Argument: the URL.
extern const std::string_view kEncodedUrlScript;

#endif
