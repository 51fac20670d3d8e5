#include "ZonCldSTLExporter.h"

#include <cstdio>

#include "ZonCloudReadNLSTool.h"
#include "ZonIExchOutputDocument.h"
#include "ZonObjectRegistry.h"

namespace {
const ZonRegistration Registration("STLExporter", ZonIExchExporter::InterfaceName,
                                   [] { return std::make_shared<ZonCldSTLExporter>(); });

std::string ParameterOr(const ZonIExchExporter::Parameters& parameters, const char* name, const char* fallback)
{
    const auto found = parameters.find(name);
    return found == parameters.end() || found->second.empty() ? fallback : found->second;
}
}  // namespace

ZonHResult ZonCldSTLExporter::Export(const ZonIExchInputDocument_var& document, const ZonUnicodeString& fileName,
                                     const Parameters& parameters)
{
    auto output = ZonQueryInterface<ZonIExchOutputDocument>(ZonObjectRegistry::CreateByLateType("CLD_STL_OutputDocument"));
    if (!output) return ZON_E_FAIL;

    ZonListValZonString names{"Precision"};
    ZonListValZonString values{ParameterOr(parameters, "Precision", "precUnknown")};
    if (const auto scaling = parameters.find("Scaling"); scaling != parameters.end()) {
        names.push_back("Scaling");
        values.push_back(scaling->second);
    }
    names.push_back("BinaryState");
    const auto binary = parameters.find("BinaryState");
    values.push_back(binary == parameters.end() ? "0" : binary->second);

    ZonHResult result = output->SetFileName(fileName);
    if (ZonFailed(result)) return result;
    result = output->SetOptions(names, values);
    if (ZonFailed(result)) return result;
    result = output->Open();
    if (ZonFailed(result)) return result;
    try {
        result = output->Write(document);
        const ZonHResult closed = output->Close();
        if (ZonFailed(result)) return result;
        if (ZonFailed(closed)) return closed;
    } catch (ZonError& error) {
        // The close that ends a broken file may fail too: the first error is the one to report.
        try {
            output->Close();
        } catch (const ZonError&) {
        }
        std::remove(fileName.c_str());
        ZonCloudReadNLSTool::FullReporterErrorList(&error);
        return ZON_E_FAIL;
    }
    return output->Release();
}
