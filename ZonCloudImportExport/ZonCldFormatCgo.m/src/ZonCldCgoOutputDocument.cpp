#include "ZonCldCgoOutputDocument.h"

#include "ZonCloudPrintFormat.h"
#include "ZonCloudReadNLSTool.h"
#include "ZonCloudScanFormat.h"
#include "ZonExchPointWalker.h"
#include "ZonIReporter.h"
#include "ZonObjectRegistry.h"

namespace {
const ZonRegistration Registration("CLD_Cgo_OutputDocument", ZonIExchOutputDocument::InterfaceName,
                                   [] { return std::make_shared<ZonCldCgoOutputDocument>(); });
}

ZonCldCgoOutputDocument::~ZonCldCgoOutputDocument() { CloseStream(); }

void ZonCldCgoOutputDocument::CloseStream()
{
    if (!_stream) return;
    std::fclose(_stream);
    _stream = nullptr;
}

ZonHResult ZonCldCgoOutputDocument::SetFileName(const ZonUnicodeString& fileName)
{
    _fileName = fileName;
    return ZON_S_OK;
}

ZonHResult ZonCldCgoOutputDocument::SetOptions(const ZonListValZonString& names, const ZonListValZonString& values)
{
    if (names.size() != values.size()) return ZON_E_FAIL;
    for (std::size_t i = 0; i < names.size(); ++i) {
        // An unreadable factor leaves the one in force.
        if (names[i] == "Scaling" && !values[i].empty()) ZonScan(values[i].c_str(), '.', "%le", &_scale);
        if (names[i] == "Precision") _readDouble = values[i] == "precDouble";
    }
    return ZON_S_OK;
}

ZonHResult ZonCldCgoOutputDocument::Open()
{
    CloseStream();
    if (_fileName.IsNull()) return ZON_E_FAIL;
    _stream = std::fopen(_fileName.c_str(), "wt");
    if (!_stream) return ZON_E_FAIL;
    // The count goes here on closing, when it is known.
    ZonPrintFile(_stream, "            \n");
    _count = 0;
    return ZON_S_OK;
}

ZonHResult ZonCldCgoOutputDocument::Write(const ZonIExchInputDocument_var& document)
{
    if (!document) return ZON_E_FAIL;
    if (!_stream) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Input, "No File");
    const double scale = _scale != 0.0 ? _scale : 1.0;
    const bool read = ZonExchPointWalker::Walk(*document, _readDouble, [&](const ZonMathPoint& p, const unsigned char*) {
        ZonPrintFile(_stream, "%f %f %f\n", p[0] * scale, p[1] * scale, p[2] * scale);
        ++_count;
        ++_written;
    });
    return read ? ZON_S_OK : ZON_E_FAIL;
}

ZonHResult ZonCldCgoOutputDocument::Close()
{
    if (!_stream) return ZON_S_OK;
    ZonPrintFile(_stream, "**end cloud**\n");
    if (std::fseek(_stream, 0, SEEK_SET) == 0) ZonPrintFile(_stream, "%-12d", static_cast<int>(_count));
    CloseStream();
    _count = 0;
    return ZON_S_OK;
}

ZonHResult ZonCldCgoOutputDocument::Release()
{
    Close();
    ZonSession* session = ZonSession::GetPtrSession();
    const ZonIReporter_var reporter = session ? session->GetReporter() : nullptr;
    if (!reporter) return ZON_S_OK;
    const char* code = _written ? "ZonCldExportCmd.ERR_FILESUCCESSFULL" : "ZonCldExportCmd.ERR_NoActivePoints";
    ZonError outcome(code, "ZonCldExportCmd");
    outcome.SetSeverity(_written ? 1 : 4);
    outcome.SetParameters({_fileName.ToUtf8()});
    reporter->BeginReport();
    reporter->Report(outcome);
    return ZON_S_OK;
}
