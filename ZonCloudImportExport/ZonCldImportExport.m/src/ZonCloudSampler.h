#pragma once
#include <cstdint>

#include "ZonCldExport.h"

// The sampling rule every reader shares: with r = percent / 100 (a float), the
// point with index k within a run is kept when the whole part of k * r differs
// from that of the previous point; before the first point that part is 1, so a
// run's first point is always kept and 100 keeps every point.
//
// The product k * r is taken in float by default. The text point readers (RGB,
// Cgo, user format) have always taken it in double from the same float r; they
// sample with InDouble; for some k and r the two round differently.
class ZON_CLD_API ZonCloudSampler {
public:
    explicit ZonCloudSampler(float percent) : step_(percent / 100.0f) {}
    // The same rule with k * r computed in double precision.
    static ZonCloudSampler InDouble(float percent)
    {
        ZonCloudSampler sampler(percent);
        sampler.inDouble_ = true;
        return sampler;
    }

    // Starts a new run (a new scan, grid or file).
    void Restart()
    {
        index_ = 0;
        previous_ = 1;
    }
    // Decides for the next point of the run.
    bool Keep()
    {
        // Past 2^24 points a float index repeats, which would drop points even
        // at 100 %; at that rate every whole part differs, so keep each point.
        if (step_ >= 1.0f) {
            ++index_;
            return true;
        }
        const auto whole = inDouble_ ? static_cast<std::int64_t>(static_cast<double>(index_) * step_)
                                     : static_cast<std::int64_t>(static_cast<float>(index_) * step_);
        ++index_;
        if (whole == previous_) return false;
        previous_ = whole;
        return true;
    }
    // How many of n points of one run are kept (without walking them one by one).
    std::uint64_t CountKept(std::uint64_t n) const;
    float Step() const { return step_; }
    bool IsInDouble() const { return inDouble_; }

private:
    float step_;
    bool inDouble_ = false;
    std::uint64_t index_ = 0;
    std::int64_t previous_ = 1;
};
