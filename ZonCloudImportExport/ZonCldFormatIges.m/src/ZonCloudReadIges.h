#pragma once
#include <cstdint>
#include <vector>

#include "ZonCloudReadFile.h"
#include "ZonICloudReadOptDirection.h"
#include "ZonTieCloudReadFile.h"

// The measured points of IGES files: the points of Point entities (116) and
// of Copious Data entities (106, forms 1 to 3). A file whose points all come
// from Point entities is one cloud; a file with copious data is a set of
// scans, one scan per copious-data entity, which also takes the isolated
// points met before it. Every other entity is ignored.
//
// Entities are found by the text at the start of a line and by the ";" that
// ends them, not by columns, so files cut at any width read the same way.
// The file is read once: the analysis keeps the points (three floats each,
// less than the text they come from) with the runs they belong to, and the
// cloud and the scans are cut and sampled from them.
class ZON_CLD_API ZonCloudReadIges : public ZonCloudReadFile,
                                     public ZonTieCloudReadScanFile<ZonCloudReadIges>,
                                     public ZonICloudReadOptDirection {
public:
    explicit ZonCloudReadIges(const ZonUnicodeString& fileName);
    ~ZonCloudReadIges() override;

    // ZonICloudReadFile
    const float* GetPoints(unsigned& count) override;

    // ZonICloudReadScanFile: one set; a file of isolated points gives them as
    // a single scan, and asking for another raises "ERR_NotAScanDigit".
    void BeginGetSetOfScans() override;
    bool NextSetOfScans() override;
    void BeginGetScan() override;
    bool NextScan() override;
    const float* GetScanPoints(unsigned& count) override;
    using ZonCloudReadFile::GetScanPointsInBox;
    using ZonCloudReadFile::GetScanPointsInBoxDouble;

    // ZonICloudReadOptDirection: kept for the caller, the order of the points stays the file's.
    void SetScanDirection(int direction) override { _scanDirection = direction; }
    void GetScanDirection(int& direction) override { direction = _scanDirection; }

    // The number of scans the file gives (runs the analysis).
    unsigned GetNumberOfScans();

protected:
    void AnalyseFile() override;

private:
    // A run is sampled on its own: the points of one copious-data entity, or
    // of Point entities that follow each other. A run that ends a copious-data
    // entity also ends a scan.
    struct Run {
        std::uint64_t end;  // one past its last point
        bool endsScan;
    };
    struct Content {
        std::vector<float> points;
        std::vector<Run> runs;
        bool hasCopiousPoints = false;
    };
    // Parses IGES text piece by piece (lines, or parts of long lines).
    class Parser;

    const float* Sampled(std::size_t firstRun, std::size_t endRun, std::vector<float>& out, unsigned& count);
    void RequireScan();

    Content _content;
    unsigned _scanCount = 0;
    int _scanDirection = 0;

    std::vector<float> _cloud;  // the sampled cloud, when sampling drops points
    float _cloudPercent = -1.0f;
    unsigned _cloudCount = 0;
    const float* _cloudPoints = nullptr;

    bool _setBegun = false;
    bool _setGiven = false;
    bool _scanBegun = false;
    bool _scansEnded = false;
    std::size_t _nextRun = 0;
    std::size_t _scanFirstRun = 0, _scanEndRun = 0;  // the current scan's runs
    bool _hasScan = false;
    std::vector<float> _scan;
};
