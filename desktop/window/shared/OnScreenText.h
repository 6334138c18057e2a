// How the television's own display looks, in pixels of the page: a white line of text on a box at the upper
// right.
#ifndef TELIX_DESKTOP_WINDOW_SHARED_ONSCREENTEXT_H
#define TELIX_DESKTOP_WINDOW_SHARED_ONSCREENTEXT_H

namespace desktop {

constexpr int kOnScreenMilliseconds = 3000;
constexpr int kOnScreenFontSize = 34;
constexpr int kOnScreenMargin = 50;
constexpr int kOnScreenPadding = 20;

// Of the box.
struct OnScreenColour {
    int red;
    int green;
    int blue;
};
constexpr OnScreenColour kOnScreenBackground{20, 28, 44};
constexpr double kOnScreenOpacity = 0.9;

} // namespace desktop

#endif
