// The page that the window shows in place of an application whose process has ended by itself.
#ifndef TELIX_DESKTOP_WINDOW_SHARED_NOTICE_H
#define TELIX_DESKTOP_WINDOW_SHARED_NOTICE_H

#include <string>

namespace desktop {

// The page as HTML, which shows the reason over the video plane.
std::string noticePage(const std::string& reason);

} // namespace desktop

#endif
