// Answers of a television in words.
#ifndef TELIX_DESKTOP_TELIXCTL_OUTPUT_H
#define TELIX_DESKTOP_TELIXCTL_OUTPUT_H

#include <json-glib/json-glib.h>
#include <string>

// What `answer` to the command says to a person, on standard output.
void printAnswer(const std::string& command, JsonObject* answer);

#endif
