#pragma once
#include <cstddef>
#include <new>
#include <stdexcept>
#include <vector>

#include "ZonBaseUnknown.h"
#include "ZonCldExport.h"
#include "ZonCloudByteSource.h"
#include "ZonCloudWorkerPool.h"
#include "ZonICloudReadFile.h"
#include "ZonICloudReadHandOver.h"

class ZonCloudOwnedArrays;

// Base of every reader: file name, byte source, sampling percent, type of
// digitization, double-precision mode, and the one-box cache of clipped points.
// The base owns the lifecycle: Analyse runs the reader's AnalyseFile hook once,
// on the first question that needs content, closes the source on any failure
// and turns memory exhaustion into the memory error. A derived reader writes
// the hook and the point queries; the base answers everything else.
class ZON_CLD_API ZonCloudReadFile : public ZonBaseUnknown, public ZonICloudReadFile, public ZonICloudReadHandOver {
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

    // ZonICloudReadHandOver, over the arrays the reader lists in ListOwnedArrays.
    bool HandOver(const float* data, std::size_t count, std::vector<float>& into) override;
    bool HandOver(const double* data, std::size_t count, std::vector<double>& into) override;
    bool HandOver(const std::uint32_t* data, std::size_t count, std::vector<std::uint32_t>& into) override;
    bool HandOver(const std::int32_t* data, std::size_t count, std::vector<std::int32_t>& into) override;
    bool HandOver(const unsigned char* data, std::size_t count, std::vector<unsigned char>& into) override;

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

    // Reads `size` bytes at `data` instead of the file (archive members, fuzz
    // inputs); the caller keeps them alive as long as the reader. Called
    // before the first question: what was read from the file stays read.
    void SetSourceMemory(const void* data, std::size_t size);

protected:
    // Runs AnalyseFile once; returns at once when already analysed.
    void Analyse();
    // The reader's analysis: opens the source (Source()), finds the type,
    // counts the points, computes the box. The source may stay open for later
    // reads; the base closes it on failure and when the reader goes.
    virtual void AnalyseFile() = 0;
    // Forgets the analysis (an option changed what is read): the next question analyses again.
    void Reanalyse();

    // The source, opened on first use; an open failure raises type 3 with the
    // system's message.
    ZonCloudByteSource& Source();
    void CloseSource() { _source.Close(); }
    // Runs `work`, which reads the source: any failure closes it, and memory
    // exhaustion raises the memory error.
    template <class Work>
    void Guarded(Work&& work)
    {
        try {
            work();
        } catch (const std::bad_alloc&) {
            CloseSource();
            RaiseMemoryError();
        } catch (const std::length_error&) {
            CloseSource();
            RaiseMemoryError();
        } catch (...) {
            CloseSource();
            throw;
        }
    }
    // The memory error of the module, naming this reader as its source.
    [[noreturn]] void RaiseMemoryError() const;
    // Room for n elements; an allocation that fails or that no vector could
    // hold ends as the memory error, never as a standard exception.
    template <class T>
    void Reserve(std::vector<T>& v, std::uint64_t n) const
    {
        Allocating([&] {
            if (n > v.max_size()) RaiseMemoryError();
            if (n > v.capacity()) {
                v.reserve(static_cast<std::size_t>(n));
                ZonCloudWorkerPool::AdviseHugePages(v.data() + v.size(), (v.capacity() - v.size()) * sizeof(T));
            }
        });
    }
    // The same for n elements in use. The pages of a large growth are made
    // present on all cores before the elements are set.
    template <class T>
    void Resize(std::vector<T>& v, std::uint64_t n) const
    {
        Allocating([&] {
            if (n > v.max_size()) RaiseMemoryError();
            if (n > v.capacity()) v.reserve(static_cast<std::size_t>(n));
            if (n > v.size()) ZonCloudWorkerPool::Populate(v.data() + v.size(), (n - v.size()) * sizeof(T));
            v.resize(static_cast<std::size_t>(n));
        });
    }
    template <class Allocation>
    void Allocating(Allocation&& allocation) const
    {
        try {
            allocation();
        } catch (const std::bad_alloc&) {
            RaiseMemoryError();
        } catch (const std::length_error&) {
            RaiseMemoryError();
        }
    }
    // Frees the three box caches and marks the cached box empty.
    void ClearBoxCaches();
    // The whole arrays whose start the reader's answers give (points, triangles,
    // colours, ...), which an importer may take over; none by default.
    virtual void ListOwnedArrays(ZonCloudOwnedArrays& arrays);

    ZonUnicodeString _fileName;
    ZonCloudByteSource _source;
    const void* _memory = nullptr;  // SetSourceMemory's bytes, read instead of the file
    std::size_t _memorySize = 0;
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
    bool TakeOwned(const T* data, std::size_t count, std::vector<T>& into);
    template <class T>
    const T* PointsInBox(const ZonMathBox& box, unsigned& count, const T* points, unsigned n,
                         std::vector<T>& cache, bool& hasCache);
    template <class T>
    const T* ScanPointsInBox(const ZonMathBox& box, unsigned& count, const T* points, unsigned n,
                             std::vector<T>& cache, bool& hasCache);
    template <class T, class Get>
    const T* GridPointsInBox(const ZonMathBox& box, unsigned& count, const unsigned char*& valid, Get get);
};
