#include "ZonCloudReadFile.h"

#include <cxxabi.h>

#include <cstdlib>
#include <new>
#include <type_traits>
#include <typeinfo>

#include "ZonCloudOperErrorTool.h"
#include "ZonCloudOwnedArrays.h"
#include "ZonCloudReadNLSTool.h"

ZonCloudReadFile::ZonCloudReadFile(const ZonUnicodeString& fileName) : _fileName(fileName) {}

ZonCloudReadFile::~ZonCloudReadFile() = default;

void ZonCloudReadFile::GetFileName(ZonUnicodeString& name) { name = _fileName; }

void ZonCloudReadFile::SetSamplingPercent(float percent)
{
    // Written so that NaN is refused too: it would make every sampling decision undefined.
    if (!(percent >= 0.0f && percent <= 100.0f))
        ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Usage, "ERR_InvalidPercentValue");
    if (percent == _samplingPercent) return;
    _samplingPercent = percent;
    ClearBoxCaches();
}

float ZonCloudReadFile::GetSamplingPercent() { return _samplingPercent; }

int ZonCloudReadFile::GetNumberOfPoints()
{
    Analyse();
    return _numberOfPoints;
}

const double* ZonCloudReadFile::GetPointsDouble(unsigned&) { return nullptr; }

const unsigned char* ZonCloudReadFile::GetPointColors(unsigned& count)
{
    count = 0;
    return nullptr;
}

const void* ZonCloudReadFile::GetPointAttributes1(unsigned& count)
{
    count = 0;
    return nullptr;
}

const void* ZonCloudReadFile::GetPointAttributes2(unsigned& count)
{
    count = 0;
    return nullptr;
}

const void* ZonCloudReadFile::GetPointAttributes3(unsigned& count)
{
    count = 0;
    return nullptr;
}

void ZonCloudReadFile::GetBoundingBox(ZonMathBox& box)
{
    Analyse();
    box = _boundingBox;
}

int ZonCloudReadFile::GetTypeOfDigitization()
{
    Analyse();
    return _digitizationType;
}

bool ZonCloudReadFile::IsTypeOfDigitization(int type)
{
    Analyse();
    return _digitizationType == type;
}

ZonICkeUnit_var ZonCloudReadFile::GetLengthUnit() { return nullptr; }

bool ZonCloudReadFile::HasDoublePrecision() { return false; }

void ZonCloudReadFile::ListOwnedArrays(ZonCloudOwnedArrays&) {}

template <class T>
bool ZonCloudReadFile::TakeOwned(const T* data, std::size_t count, std::vector<T>& into)
{
    ZonCloudOwnedArrays arrays;
    ListOwnedArrays(arrays);
    return arrays.Take(data, count, into);
}

bool ZonCloudReadFile::HandOver(const float* data, std::size_t count, std::vector<float>& into)
{
    return TakeOwned(data, count, into);
}
bool ZonCloudReadFile::HandOver(const double* data, std::size_t count, std::vector<double>& into)
{
    return TakeOwned(data, count, into);
}
bool ZonCloudReadFile::HandOver(const std::uint32_t* data, std::size_t count, std::vector<std::uint32_t>& into)
{
    return TakeOwned(data, count, into);
}
bool ZonCloudReadFile::HandOver(const std::int32_t* data, std::size_t count, std::vector<std::int32_t>& into)
{
    return TakeOwned(data, count, into);
}
bool ZonCloudReadFile::HandOver(const unsigned char* data, std::size_t count, std::vector<unsigned char>& into)
{
    return TakeOwned(data, count, into);
}

void ZonCloudReadFile::BeginGetSetOfScans() {}
bool ZonCloudReadFile::NextSetOfScans() { return false; }
void ZonCloudReadFile::BeginGetScan() {}
bool ZonCloudReadFile::NextScan() { return false; }

const float* ZonCloudReadFile::GetScanPoints(unsigned& count)
{
    count = 0;
    return nullptr;
}

const double* ZonCloudReadFile::GetScanPointsDouble(unsigned& count)
{
    count = 0;
    return nullptr;
}

void ZonCloudReadFile::BeginGetGrid() {}
bool ZonCloudReadFile::NextGrid() { return false; }
void ZonCloudReadFile::BeginGetGridPoints() {}

const float* ZonCloudReadFile::GetGridPoints(unsigned& count, const unsigned char*& valid)
{
    count = 0;
    valid = nullptr;
    return nullptr;
}

const double* ZonCloudReadFile::GetGridPointsDouble(unsigned& count, const unsigned char*& valid)
{
    count = 0;
    valid = nullptr;
    return nullptr;
}

bool ZonCloudReadFile::IsInQueryBox(double x, double y, double z, const ZonMathBox& query, const ZonMathBox& file)
{
    const double v[3] = {x, y, z};
    const ZonMathPoint& low = query.GetLow();
    const ZonMathPoint& high = query.GetHigh();
    const ZonMathPoint& fileHigh = file.GetHigh();
    for (int axis = 0; axis < 3; ++axis) {
        if (!(low[axis] <= v[axis])) return false;
        const bool closed = !file.IsEmpty() && high[axis] == fileHigh[axis];
        if (closed ? !(v[axis] <= high[axis]) : !(v[axis] < high[axis])) return false;
    }
    return true;
}

template <class T>
const T* ZonCloudReadFile::PointsInBox(const ZonMathBox& box, unsigned& count, const T* points, unsigned n,
                                       std::vector<T>& cache, bool& hasCache)
{
    ZonMathBox fileBox;
    GetBoundingBox(fileBox);
    if (points && box.IsSameAs(fileBox)) {
        count = n;
        return points;
    }
    if (hasCache) {
        if (!_cachedBoxEmpty && box.IsSameAs(_cachedBox)) {
            count = _cachedCount;
            return cache.data();
        }
        ClearBoxCaches();
    }
    // Both precisions share the cached box and count. Without a cache of this
    // precision they describe the other one's result, which must neither give
    // this query its count nor pass later for this query's box: drop it.
    if constexpr (std::is_same_v<T, float>) {
        std::vector<double>().swap(_cachedPointsDouble);
        _hasCachedPointsDouble = false;
    } else {
        std::vector<float>().swap(_cachedPoints);
        _hasCachedPoints = false;
    }
    _cachedBox.SetToEmpty();
    _cachedBoxEmpty = true;
    _cachedCount = 0;
    count = _cachedCount;
    if (!points || n == 0 || !box.Intersects(fileBox, 0.0)) return nullptr;

    _cachedBox = box;
    _cachedBoxEmpty = false;
    Resize(cache, 3 * static_cast<std::size_t>(n));
    hasCache = true;
    std::size_t kept = 0;
    for (unsigned i = 0; i < n; ++i) {
        const T* p = points + 3 * static_cast<std::size_t>(i);
        if (!IsInQueryBox(p[0], p[1], p[2], box, fileBox)) continue;
        cache[3 * kept] = p[0];
        cache[3 * kept + 1] = p[1];
        cache[3 * kept + 2] = p[2];
        ++kept;
    }
    _cachedCount = static_cast<unsigned>(kept);
    count = _cachedCount;
    return cache.data();
}

const float* ZonCloudReadFile::GetPointsInBox(const ZonMathBox& box, unsigned& count)
{
    count = 0;
    unsigned n = 0;
    const float* points = GetPoints(n);
    return PointsInBox(box, count, points, n, _cachedPoints, _hasCachedPoints);
}

const double* ZonCloudReadFile::GetPointsInBoxDouble(const ZonMathBox& box, unsigned& count)
{
    count = 0;
    unsigned n = 0;
    const double* points = GetPointsDouble(n);
    return PointsInBox(box, count, points, n, _cachedPointsDouble, _hasCachedPointsDouble);
}

template <class T>
const T* ZonCloudReadFile::ScanPointsInBox(const ZonMathBox& box, unsigned& count, const T* points, unsigned n,
                                           std::vector<T>& cache, bool& hasCache)
{
    count = 0;
    if (!points || n == 0) return nullptr;
    ZonMathBox fileBox;
    GetBoundingBox(fileBox);
    Resize(cache, 3 * static_cast<std::size_t>(n));
    hasCache = true;
    std::size_t kept = 0;
    for (unsigned i = 0; i < n; ++i) {
        const T* p = points + 3 * static_cast<std::size_t>(i);
        if (!IsInQueryBox(p[0], p[1], p[2], box, fileBox)) continue;
        cache[3 * kept] = p[0];
        cache[3 * kept + 1] = p[1];
        cache[3 * kept + 2] = p[2];
        ++kept;
    }
    if (kept == 0) {
        ClearBoxCaches();
        return nullptr;
    }
    _cachedCount = static_cast<unsigned>(kept);
    count = _cachedCount;
    return cache.data();
}

const float* ZonCloudReadFile::GetScanPointsInBox(const ZonMathBox& box, unsigned& count)
{
    if (!IsTypeOfDigitization(DigitizationScans))
        ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Usage, "ERR_NotAScanDigit");
    // Scan results are never reused: the same box means another scan next time.
    ClearBoxCaches();
    unsigned n = 0;
    const float* points = GetScanPoints(n);
    return ScanPointsInBox(box, count, points, n, _cachedPoints, _hasCachedPoints);
}

const double* ZonCloudReadFile::GetScanPointsInBoxDouble(const ZonMathBox& box, unsigned& count)
{
    if (!IsTypeOfDigitization(DigitizationScans))
        ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Usage, "ERR_NotAScanDigit");
    ClearBoxCaches();
    unsigned n = 0;
    const double* points = GetScanPointsDouble(n);
    return ScanPointsInBox(box, count, points, n, _cachedPointsDouble, _hasCachedPointsDouble);
}

template <class T, class Get>
const T* ZonCloudReadFile::GridPointsInBox(const ZonMathBox& box, unsigned& count, const unsigned char*& valid,
                                           Get get)
{
    if (!IsTypeOfDigitization(DigitizationGrids))
        ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Usage, "ERR_NotAGridDigit");
    _cachedValidity.clear();
    _cachedValidity.shrink_to_fit();
    ZonMathBox fileBox;
    GetBoundingBox(fileBox);
    for (;;) {
        unsigned n = 0;
        const unsigned char* gridValid = nullptr;
        const T* points = get(n, gridValid);
        if (!points) {
            count = 0;
            valid = nullptr;
            return nullptr;
        }
        if (n == 0) continue;  // empty rows are skipped until content or the end
        Resize(_cachedValidity, n);
        for (unsigned i = 0; i < n; ++i) {
            const T* p = points + 3 * static_cast<std::size_t>(i);
            const bool wasValid = gridValid == nullptr || gridValid[i] != 0;
            _cachedValidity[i] = wasValid && IsInQueryBox(p[0], p[1], p[2], box, fileBox) ? 1 : 0;
        }
        count = n;
        valid = _cachedValidity.data();
        return points;
    }
}

const float* ZonCloudReadFile::GetGridPointsInBox(const ZonMathBox& box, unsigned& count,
                                                  const unsigned char*& valid)
{
    return GridPointsInBox<float>(box, count, valid, [this](unsigned& n, const unsigned char*& v) {
        return GetGridPoints(n, v);
    });
}

const double* ZonCloudReadFile::GetGridPointsInBoxDouble(const ZonMathBox& box, unsigned& count,
                                                         const unsigned char*& valid)
{
    return GridPointsInBox<double>(box, count, valid, [this](unsigned& n, const unsigned char*& v) {
        return GetGridPointsDouble(n, v);
    });
}

void ZonCloudReadFile::SetSourceMemory(const void* data, std::size_t size)
{
    CloseSource();
    _memory = data;
    _memorySize = size;
}

void ZonCloudReadFile::Analyse()
{
    if (_analysed) return;
    Guarded([this] { AnalyseFile(); });
    _analysed = true;
}

void ZonCloudReadFile::Reanalyse()
{
    CloseSource();
    ClearBoxCaches();
    _analysed = false;
}

ZonCloudByteSource& ZonCloudReadFile::Source()
{
    if (_source.IsOpen()) return _source;
    if (_memory)
        _source.OpenMemory(_memory, _memorySize);
    else
        _source.Open(_fileName.ToUtf8());
    return _source;
}

void ZonCloudReadFile::RaiseMemoryError() const
{
    ZonCloudOperError error(ZonCloudOperErrorTool::InsufficientMemoryKey, ZonCloudOperErrorTool::Catalog);
    error.SetSeverity(4);
    int status = 0;
    char* name = abi::__cxa_demangle(typeid(*this).name(), nullptr, nullptr, &status);
    error.SetSource(status == 0 && name ? name : typeid(*this).name(), 0);
    std::free(name);
    throw error;
}

void ZonCloudReadFile::ClearBoxCaches()
{
    _cachedBox.SetToEmpty();
    _cachedBoxEmpty = true;
    _cachedCount = 0;
    _cachedPoints.clear();
    _cachedPoints.shrink_to_fit();
    _cachedPointsDouble.clear();
    _cachedPointsDouble.shrink_to_fit();
    _cachedValidity.clear();
    _cachedValidity.shrink_to_fit();
    _hasCachedPoints = false;
    _hasCachedPointsDouble = false;
}
