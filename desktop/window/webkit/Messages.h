// The names of the messages between the window and its extension in the web process.
#ifndef TELIX_DESKTOP_WINDOW_WEBKIT_MESSAGES_H
#define TELIX_DESKTOP_WINDOW_WEBKIT_MESSAGES_H

namespace desktop {

// To a page, without parameters. The reply has the mask of the key groups that pages receive (u), or none if
// the platform library has no key set.
constexpr char kKeySetMessage[] = "telix-key-set";
// To a page: tune to the channel of that number (u). The reply has number and name of the channel that is on
// then (us), or none without a library.
constexpr char kTuneMessage[] = "telix-tune";
// To a page: tune to the channel so many positions after the one that is on (i). The reply is the same.
constexpr char kStepMessage[] = "telix-step";
// To a page: the volume of the set (u).
constexpr char kVolumeMessage[] = "telix-volume";
// To the window's context: what the channel that is on signals, see SignallingMessage.h.
constexpr char kSignallingMessage[] = "telix-signalling";
// To the window's context: a request of the control socket (s). The reply has the response (s).
constexpr char kControlMessage[] = "telix-control";

// To the window's context (t): the page shows the video of the object with that number of telix_picture.h,
// which the video plane leaves out, or 0. The reply, without parameters, comes when the plane has changed.
constexpr char kPagePresenterMessage[] = "telix-page-presenter";

// To a page, without parameters: the window is about to take a screenshot. The reply, without parameters,
// comes when the newest frame is in the ring and in the page, if the page paints the frames.
constexpr char kNewestFrameMessage[] = "telix-newest-frame";

// To the window's context: a request of media, with its URL (ay). The reply has what it carries: user agent,
// Referer and cookies, and whether it accepts any certificate (ayayayb).
constexpr char kMediaRequestMessage[] = "telix-media-request";
// To the window's context: a response of media has set a cookie (ayay): the URL, and the value of Set-Cookie.
constexpr char kMediaCookieMessage[] = "telix-media-cookie";

// To the window's context: a warning of a page (tss): the page's id, the warning's name and subject, see
// Warnings.h.
constexpr char kWarningMessage[] = "telix-warning";

} // namespace desktop

#endif
