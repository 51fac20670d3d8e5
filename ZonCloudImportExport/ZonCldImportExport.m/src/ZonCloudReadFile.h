#pragma once
#include <cstdio>
#include <vector>

#include "ZonBaseUnknown.h"
#include "ZonCldExport.h"
#include "ZonICloudReadFile.h"

// Base of every reader: file name, open stream, sampling percent, type of
// digitization, double-precision mode, and the one-box cache of clipped points.
// A derived reader implements Analyse (run once, on the first question that
// needs content) and the point queries; the base answers everything else.
class ZON_CLD_API ZonCloudReadFile : public ZonBaseUnknown, public ZonICloudReadFile {
public:
    explicit ZonCloudReadFile(const ZonUnicodeString& fileName);
    ~ZonCloudReadFile() override;
    ZonCloudReadFile(const ZonCloudReadFile&) = delete;
    ZonCloudReadFile& operator=(const ZonCloudReadFile&) = delete;

    // ZonICloudReadFile
    void GetFileName(ZonUnicodeString& name) override;
    void SetSamplingPercent(float percent) override;
    float GetSamplingPercent() override;
    int GetNumberOfPoints() override;  // runs Analyse, returns _numberOfPoints
    const double* GetPointsDouble(unsigned& count) override;
    void SetDoublePrecision(bool on) override { _doublePrecision = on; }
    bool IsDoublePrecision() override { return _doublePrecision; }
    const unsigned char* GetPointColors(unsigned& count) override;
    const void* GetPointAttributes1(unsigned& count) override;
    const void* GetPointAttributes2(unsigned& count) override;
    const void* GetPointAttributes3(unsigned& count) override;
    void GetBoundingBox(ZonMathBox& box) override;  // runs Analyse, copies _boundingBox
    const float* GetPointsInBox(const ZonMathBox& box, unsigned& count) override;
    const double* GetPointsInBoxDouble(const ZonMathBox& box, unsigned& count) override;
    int GetTypeOfDigitization() override;
    bool IsTypeOfDigitization(int type) override;
    ZonICkeUnit_var GetLengthUnit() override;
    bool HasDoublePrecision() override;

    // Defaults of the scan and grid protocols; readers that offer those
    // interfaces override what they need (see ZonTieCloudReadScanFile).
    virtual void BeginGetSetOfScans();
    virtual bool NextSetOfScans();
    virtual void BeginGetScan();
    virtual bool NextScan();
    virtual const float* GetScanPoints(unsigned& count);
    virtual const double* GetScanPointsDouble(unsigned& count);
    virtual void BeginGetGrid();
    virtual bool NextGrid();
    virtual void BeginGetGridPoints();
    virtual const float* GetGridPoints(unsigned& count, const unsigned char*& valid);
    virtual const double* GetGridPointsDouble(unsigned& count, const unsigned char*& valid);

    // Box queries over the current scan or grid, built on the protocol above.
    const float* GetScanPointsInBox(const ZonMathBox& box, unsigned& count);
    const double* GetScanPointsInBoxDouble(const ZonMathBox& box, unsigned& count);
    const float* GetGridPointsInBox(const ZonMathBox& box, unsigned& count, const unsigned char*& valid);
    const double* GetGridPointsInBoxDouble(const ZonMathBox& box, unsigned& count, const unsigned char*& valid);

    // The inclusion rule of every box query: low <= v < high on each axis,
    // the upper face closed where the query's high equals the file's high.
    static bool IsInQueryBox(double x, double y, double z, const ZonMathBox& query, const ZonMathBox& file);

protected:
    // Opens the file, finds the type, counts the points, computes the box.
    // Must return at once when already analysed.
    virtual void Analyse() = 0;

    // Opens _file read-only ("rb"); a failure raises type 3 with the errno message.
    void OpenFile();
    // Rewinds _file; a failure raises type 1 with the errno message.
    void RewindFile();
    void CloseFile();
    // Frees the three box caches and marks the cached box empty.
    void ClearBoxCaches();

    ZonUnicodeString _fileName;
    FILE* _file = nullptr;
    float _samplingPercent = 100.0f;
    int _digitizationType = DigitizationUnknown;
    bool _doublePrecision = false;
    ZonMathBox _cachedBox;
    bool _cachedBoxEmpty = true;
    unsigned _cachedCount = 0;
    std::vector<float> _cachedPoints;
    std::vector<double> _cachedPointsDouble;
    std::vector<unsigned char> _cachedValidity;
    bool _hasCachedPoints = false;        // the single cache "exists" (may hold 0 points)
    bool _hasCachedPointsDouble = false;  // the double cache "exists"

    // By convention every derived reader fills these during Analyse.
    int _numberOfPoints = 0;
    ZonMathBox _boundingBox;
    bool _analysed = false;

private:
    template <class T>
    const T* PointsInBox(const ZonMathBox& box, unsigned& count, const T* points, unsigned n,
                         std::vector<T>& cache, bool& hasCache);
    template <class T>
    const T* ScanPointsInBox(const ZonMathBox& box, unsigned& count, const T* points, unsigned n,
                             std::vector<T>& cache, bool& hasCache);
    template <class T, class Get>
    const T* GridPointsInBox(const ZonMathBox& box, unsigned& count, const unsigned char*& valid, Get get);
};
