#pragma once
#include "ZonCloudReadFile.h"
#include "ZonICloudReadGridFile.h"
#include "ZonICloudReadScanFile.h"

// Thin interface objects: a reader offers the scan or grid interface by also
// deriving from the matching tie, which forwards each operation to the
// reader's own (virtual) operation, so the base's defaults and the reader's
// overrides both apply. Readers that do not derive from a tie do not offer it.
template <class Reader>
class ZonTieCloudReadScanFile : public ZonICloudReadScanFile {
public:
    void BeginGetSetOfScans() override { Self().BeginGetSetOfScans(); }
    bool NextSetOfScans() override { return Self().NextSetOfScans(); }
    void BeginGetScan() override { Self().BeginGetScan(); }
    bool NextScan() override { return Self().NextScan(); }
    const float* GetScanPoints(unsigned& count) override { return Self().GetScanPoints(count); }
    const double* GetScanPointsDouble(unsigned& count) override { return Self().GetScanPointsDouble(count); }
    const float* GetScanPointsInBox(const ZonMathBox& box, unsigned& count) override
    {
        return Self().GetScanPointsInBox(box, count);
    }
    const double* GetScanPointsInBoxDouble(const ZonMathBox& box, unsigned& count) override
    {
        return Self().GetScanPointsInBoxDouble(box, count);
    }

private:
    ZonCloudReadFile& Self() { return static_cast<Reader&>(*this); }
};

template <class Reader>
class ZonTieCloudReadGridFile : public ZonICloudReadGridFile {
public:
    void BeginGetGrid() override { Self().BeginGetGrid(); }
    bool NextGrid() override { return Self().NextGrid(); }
    void BeginGetGridPoints() override { Self().BeginGetGridPoints(); }
    const float* GetGridPoints(unsigned& count, const unsigned char*& valid) override
    {
        return Self().GetGridPoints(count, valid);
    }
    const double* GetGridPointsDouble(unsigned& count, const unsigned char*& valid) override
    {
        return Self().GetGridPointsDouble(count, valid);
    }
    const float* GetGridPointsInBox(const ZonMathBox& box, unsigned& count, const unsigned char*& valid) override
    {
        return Self().GetGridPointsInBox(box, count, valid);
    }
    const double* GetGridPointsInBoxDouble(const ZonMathBox& box, unsigned& count,
                                           const unsigned char*& valid) override
    {
        return Self().GetGridPointsInBoxDouble(box, count, valid);
    }

private:
    ZonCloudReadFile& Self() { return static_cast<Reader&>(*this); }
};
