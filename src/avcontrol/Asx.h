// ASX playlists: reads the list of clips of an A/V control object and says which clip is current,
// which comes next and where a repeat section turns back.
//
// There is one list in the process; the next parse replaces it. No input is an error. Nothing is locked: all
// functions run on the browser thread, but asxNextClip, asxGetStartTime and asxGetDuration are also reached
// from the monitor thread of a playing object. Strings are handed out as copies.
#ifndef TELIX_AVCONTROL_ASX_H
#define TELIX_AVCONTROL_ASX_H

#include <cstdlib>
#include <memory>
#include <string>

// The playlist if `data` is one, else an empty string. `data` is read as a zero-terminated string whatever
// `size` says, so the caller terminates it; null gives an empty string.
std::string asxIsAsxfile(const void* data, unsigned size);

// Reads the playlist `text` (zero-terminated, not null), which was found at `url`, and makes its first clip
// the current one. A playlist without clips leaves the list empty. Takes time proportional to the length.
// Always 0.
int asxParseAsx(const char* text, const std::string& url);

// The same for a playlist that the list takes over, so that it is not copied; null is an empty one. The list
// takes one byte for each of the playlist, and a record of fixed size for each clip and each parameter.
struct FreeBlock {
    void operator()(char* block) const { std::free(block); }
};
using AsxText = std::unique_ptr<char, FreeBlock>; // zero-terminated, of the C heap
int asxParseAsx(AsxText text, const std::string& url);

// Empties the list. The strings of the list as a whole and its base URL stay until a parse sets others.
void asxClear();

// Logs everything that the list holds; afterwards the first clip is the current one.
void asxPrintAsxData();

// About the list as a whole.
std::string asxShowFileName();
std::string asxShowTitle();
std::string asxShowAuthor();
std::string asxShowCopyRight();
std::string asxShowRating();
std::string asxShowDescription();

// About the current clip; empty without one.
std::string asxShowClipFileName();
std::string asxShowClipTitle();
std::string asxShowClipAuthor();
std::string asxShowClipCopyRight();
std::string asxShowClipRating();
std::string asxShowClipDescription();

// Whether the viewer may skip the current clip: 1 or 0; 1 without a clip.
unsigned asxGetClientSkip();

// Where the current clip starts and how long it plays, in seconds; 0 if it doesn't say and without a clip.
unsigned asxGetStartTime();
unsigned asxGetDuration();

// The number of clips; 0 means that there is no playlist. Clips have the indices 1 to this number.
unsigned asxGetClipCount();

// Makes the clip `index` the current one: 1, or 0 if there is none.
int asxSetCurrentClipIndex(unsigned index);

// The index of the current clip, 0 without one.
unsigned asxGetCurrentClipIndex();

// Move to the neighbour of the current clip in file order, repeats left aside: its index, or 0 if there is no
// such clip.
unsigned asxNextClip();
unsigned asxPrevClip();

// Whether the current clip ends a pass through the repeat section and another pass is due: 1 or 0.
int asxIsEndofRepeat();

// Begins the next pass through the repeat section. A section of one clip begins again without moving.
void asxGotoStartofRepeat();

// The name of the n-th parameter, from 1, of the clip `index` or, for index 0, of the list as a whole; empty
// if there is none.
std::string asxGetParamName(unsigned index, unsigned n);

// An empty string, whatever the name: see the definition.
std::string asxGetParam(unsigned index, const std::string& name);

// `base` and `path` with exactly one "/" made sure of between them, absolute or not; empty if either is.
std::string asxAppendBaseUrl(const std::string& base, const std::string& path);

#endif
