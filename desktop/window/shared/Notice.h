// The page that the window shows in place of an application whose process has ended by itself.
#ifndef TELIX_DESKTOP_WINDOW_SHARED_NOTICE_H
#define TELIX_DESKTOP_WINDOW_SHARED_NOTICE_H

#include <cstdint>
#include <string>

namespace desktop {

// The page as HTML. It shows the reason, and the channel of that number, if it is not 0, beneath.
std::string noticePage(const std::string& reason, uint32_t channel);

} // namespace desktop

#endif
