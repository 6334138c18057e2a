// The model of one parental rating: a view of a platform handle, or a threshold made from a plain number,
// which the platform knows nothing of. Browser thread only.
#ifndef TELIX_SRC_PARENTAL_PARENTALRATING_H
#define TELIX_SRC_PARENTAL_PARENTALRATING_H

#include "common/PluginBase.h"

class ParentalRating final : public PluginBase {
public:
    explicit ParentalRating(NPP npp);

    // 0 means no handle: the platform is never asked.
    uint32_t getParentalRatingHandle() const { return m_handle; }
    void setParentalRatingHandle(uint32_t handle) { m_handle = handle; }

    // Turns the rating into a threshold of a scheme.
    void setThresholdProperties(unsigned int threshold, const std::string& scheme);

    // Fetched once and kept; empty until the platform has given one.
    std::string getName();
    std::string getScheme();
    std::string getRegion();

    // The platform's values at this moment; the last ones, at first 0, if it refuses. The labels are a bit
    // field of the platform's.
    int32_t getValue();
    int32_t getLabels();

private:
    template <class Ask>
    std::string fetchString(std::string& cache, Ask ask) const;
    template <class Ask>
    int32_t fetchNumber(int32_t& last, Ask ask) const;

    bool m_isThreshold = false;
    std::string m_name;
    std::string m_scheme;
    std::string m_region;
    int32_t m_value = 0;
    int32_t m_labels = 0;
    uint32_t m_handle = 0;
};

#endif
