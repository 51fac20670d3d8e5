#include "ZonCld3MFExporter.h"

#include <new>

#include "ZonCld3MFOutputDocument.h"
#include "ZonCloudOperErrorTool.h"
#include "ZonCloudReadNLSTool.h"
#include "ZonObjectRegistry.h"
#include "ZonZipWriter.h"

namespace {

const ZonRegistration Registration("3MFExporter", ZonIExchExporter::InterfaceName,
                                   [] { return std::make_shared<ZonCld3MFExporter>(); });

// The host holds geometry in millimetres (the import engine converts every
// file's unit to them); 3MF spells its units out in lower case.
const char* HostLengthUnit() { return "millimeter"; }

// Package parts are text that deflates well even at the fastest level, and
// the fastest level keeps packing from costing more than writing.
constexpr int CompressionLevel = 1;

}  // namespace

ZonHResult ZonCld3MFExporter::Export(const ZonIExchInputDocument_var& document, const ZonUnicodeString& fileName,
                                     const Parameters& parameters)
{
    auto output = ZonQueryInterface<ZonCld3MFOutputDocument>(
        ZonObjectRegistry::CreateByLateType("MUXE_3MF_OutputDocument"));
    if (!output || !document) return ZON_E_FAIL;
    document->SetAttribute("MUXE_MATERIAL_ON_TESS", "True");
    document->SetAttribute("CAD_Format", "3MF");

    ZonListValZonString names{"ExportUnit"};
    ZonListValZonString values{HostLengthUnit()};
    for (const char* name : {"Scaling", "Strict"})
        if (const auto found = parameters.find(name); found != parameters.end()) {
            names.push_back(name);
            values.push_back(found->second);
        }

    ZonHResult result = output->SetOptions(names, values);
    if (ZonFailed(result)) return result;
    result = output->SetFileName(fileName);
    if (ZonFailed(result)) return result;
    result = output->Open();
    if (ZonFailed(result)) return result;
    try {
        try {
            result = output->Write(document);
            output->Close();
            if (ZonSucceeded(result) && output->GetObjectCount() > 0) {
                ZonZipWriter zip(fileName.ToUtf8());
                zip.SetCompressionLevel(CompressionLevel);
                for (const std::string& part : output->GetPartNames())
                    zip.AddFile(part, output->GetPackageDirectory() + "/" + part);
                zip.Commit();
            }
        } catch (const std::bad_alloc&) {
            ZonCloudOperErrorTool::ThrowInsufficientMemory();
        }
    } catch (ZonError& error) {
        // A part left open by the error may fail to close too: the first error is the one to report.
        try {
            output->Close();
        } catch (const ZonError&) {
        }
        output->RemovePackageDirectory();
        ZonCloudReadNLSTool::FullReporterErrorList(&error);
        return ZON_E_FAIL;
    }
    output->RemovePackageDirectory();
    if (ZonFailed(result)) return result;
    return output->Release();
}
