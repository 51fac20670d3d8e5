#include "ZonCldPointOutputDocument.h"

#include "ZonCloudExportOutcome.h"
#include "ZonCloudReadNLSTool.h"
#include "ZonCloudScanFormat.h"
#include "ZonExchPointWalker.h"

ZonHResult ZonCldPointOutputDocument::SetFileName(const ZonUnicodeString& fileName)
{
    _fileName = fileName;
    return ZON_S_OK;
}

ZonHResult ZonCldPointOutputDocument::SetOptions(const ZonListValZonString& names, const ZonListValZonString& values)
{
    if (names.size() != values.size()) return ZON_E_FAIL;
    for (std::size_t i = 0; i < names.size(); ++i) {
        // An unreadable factor leaves the one in force.
        if (names[i] == "Scaling" && !values[i].empty()) ZonScan(values[i].c_str(), '.', "%le", &_scale);
        if (names[i] == "Precision") _readDouble = values[i] == "precDouble";
    }
    return ZON_S_OK;
}

ZonHResult ZonCldPointOutputDocument::Open()
{
    _pending.Discard();
    if (!_output.Open(_fileName, "w")) return ZON_E_FAIL;
    _inFile = 0;
    BeginFile();
    return ZON_S_OK;
}

ZonHResult ZonCldPointOutputDocument::Write(const ZonIExchInputDocument_var& document)
{
    if (!document) return ZON_E_FAIL;
    if (!_output.IsOpen()) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Input, "No File");
    const double scale = _scale != 0.0 ? _scale : 1.0;
    const bool read = ZonExchPointWalker::Walk(*document, _readDouble, [&](const ZonMathPoint& p, const unsigned char* rgb) {
        double* record = _pending.Add(_output);
        for (int k = 0; k < 3; ++k) record[k] = p[k] * scale;
        record[3] = rgb ? 1 : 0;
        for (int k = 0; k < 3; ++k) record[4 + k] = rgb ? rgb[k] : 0;
        ++_written;
        ++_inFile;
    });
    return read ? ZON_S_OK : ZON_E_FAIL;
}

ZonHResult ZonCldPointOutputDocument::Close()
{
    if (_output.IsOpen()) {
        _pending.Flush(_output);
        EndFile();
    }
    _output.Close();
    return ZON_S_OK;
}

ZonHResult ZonCldPointOutputDocument::Release()
{
    Close();
    if (_output.HasFailed()) return ZON_E_FAIL;
    if (_written) ZonCloudExportOutcome::Report("ERR_FILESUCCESSFULL", _fileName, ZonCloudExportOutcome::Written);
    else ZonCloudExportOutcome::Report("ERR_NoActivePoints", _fileName, ZonCloudExportOutcome::NotWritten);
    return ZON_S_OK;
}
