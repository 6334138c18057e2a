// The model of one rating scheme: its name, the names of its ratings with their icons, and the threshold that
// is set for it. Browser thread only.
#ifndef TELIX_SRC_PARENTAL_PARENTALRATINGSCHEME_H
#define TELIX_SRC_PARENTAL_PARENTALRATINGSCHEME_H

#include <vector>

#include "common/PluginBase.h"
#include "telix/telix_platform.h"

class ParentalRatingScheme final : public PluginBase {
public:
    explicit ParentalRatingScheme(NPP npp);

    // Copies the platform's record. A record without a name leaves the scheme as it is.
    void setHandle(PARENTALRATTINGSCHEME_STRUCT_T_TAG record);

    std::string getName() const { return m_name; }

    // The number of ratings that a page sees.
    uint32_t getLength() const;

    // The name of a rating, and the URL of its icon; empty beyond the end.
    std::string getitem(unsigned int index) const;
    std::string getIconUri(unsigned int index) const;

    // The place of the first rating of this name; the largest value, -1 in script, if there is none.
    uint32_t getIndexOf(const std::string& name) const;

    // A new rating that stands for the threshold, made at every call; the caller owns one reference. Null if
    // the platform has none.
    NPObject* getThreshold();

private:
    std::string m_name;
    uint32_t m_count = 0;
    uint32_t m_handle = 0;
    std::vector<std::string> m_ratingNames;
    std::vector<std::string> m_iconUris;
};

#endif
