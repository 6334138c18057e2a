// scripts/page.js, which is embedded at build time.
#ifndef TELIX_BRIDGE_PAGESCRIPT_H
#define TELIX_BRIDGE_PAGESCRIPT_H

namespace bridge {

// An expression whose value is the function that makes a document the page's (see Page::start()).
extern const char kPageScript[];

} // namespace bridge

#endif
