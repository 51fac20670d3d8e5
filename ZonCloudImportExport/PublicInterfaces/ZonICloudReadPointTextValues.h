#pragma once
#include <cstdint>

#include "ZonCldExport.h"
#include "ZonUnicodeString.h"

// Optional interface of a reader whose per-point texts are one label followed
// by one integer per point. A reader with millions of points answers this
// instead of building one string per point; the import engine asks it before
// the text array of GetPointAttributes3.
class ZON_CLD_API ZonICloudReadPointTextValues {
public:
    virtual ~ZonICloudReadPointTextValues() = default;
    // The label put before every value, and one value per point of GetPoints;
    // null (count 0) when the points have no text.
    virtual const std::int32_t* GetPointTextValues(unsigned& count, ZonUnicodeString& label) = 0;
};
