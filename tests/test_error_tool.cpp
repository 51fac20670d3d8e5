// Raising, reporting and catalog texts.
#include <gtest/gtest.h>

#include <cerrno>

#include "ZonCloudOperErrorTool.h"
#include "ZonCloudReadNLSTool.h"
#include "ZonIReporter.h"
#include "ZonMsgCatalog.h"

namespace {

TEST(ErrorTool, ThrowGivesSeverityTypePlusOneAndOtherTypesRaiseNothing)
{
    for (int type = 0; type <= 3; ++type) {
        try {
            ZonCloudReadNLSTool::Throw(type, "ERR_Failure");
            FAIL() << type;
        } catch (const ZonCloudOperError& e) {
            EXPECT_EQ(e.GetMessageKey(), "ZonCloudReadNLSTool.ERR_Failure");
            EXPECT_EQ(e.GetCatalogName(), "ZonCloudImportExport");
            EXPECT_EQ(e.GetSeverity(), type + 1);
            EXPECT_EQ(e.GetNLSMessage(), "The operation failed.");
        }
    }
    EXPECT_NO_THROW(ZonCloudReadNLSTool::Throw(4, "ERR_Failure"));
    EXPECT_NO_THROW(ZonCloudReadNLSTool::Throw(-1, "ERR_Failure"));
}

TEST(ErrorTool, NoCodeTakesTheKeyFromErrno)
{
    errno = EACCES;
    try {
        ZonCloudReadNLSTool::Throw(1, nullptr);
        FAIL();
    } catch (const ZonError& e) {
        EXPECT_EQ(e.GetCatalogName(), "ZonCldResOperError");
        EXPECT_EQ(e.GetMessageKey(), "ZonCloudOperErrorTool.ERR_EACCES");
        EXPECT_EQ(e.GetNLSMessage(), "Permission denied");
        EXPECT_EQ(e.GetSeverity(), 2);
    }
}

TEST(ErrorTool, EveryErrorCodeHasAnEnglishText)
{
    const char* codes[] = {"ERR_NotAScanDigit", "ERR_NotAGridDigit", "ERR_NotAPolygonDigit",
                           "ERR_BeginGetSetOfScansNotDone", "ERR_NextSetOfScansNotDone", "ERR_BeginGetScanNotDone",
                           "ERR_BeginGetGridNotDone", "ERR_NextGridNotDone", "ERR_BeginGetPolygonNotDone",
                           "ERR_GridNumberIsInvalid", "ERR_InvalidPercentValue", "ERR_NoPointFound",
                           "ERR_UnknownData", "ERR_UnknownDataOrDelimiter", "ERR_TooManyUnknownData",
                           "ERR_FormatNotImplemented", "ERR_Failure", "ERR_InsufficientMemory",
                           "ERR_ColorIndexOutOfRange", "ERR_SymbolIndexOutOfRange", "ERR_UnknownExtension",
                           "ERR_NoActivePoints", "ERR_NoActiveScans", "ERR_NoActivePolygons", "ERR_FILESUCCESSFULL",
                           "ERR_NotInMeshFile_Cloud", "ERR_NotInMeshFile_Scan", "ERR_NotInMeshFile_Grid",
                           "ERR_NotInMeshFile_Cloud_Scan", "ERR_NotInMeshFile_Cloud_Grid",
                           "ERR_NotInMeshFile_Scan_Grid", "ERR_NotInMeshFile_Cloud_Scan_Grid"};
    for (const char* code : codes) {
        const std::string key = std::string("ZonCloudReadNLSTool.") + code;
        EXPECT_FALSE(ZonMsgCatalog::Lookup("ZonCloudImportExport", key).empty()) << key;
        const std::string exportKey = std::string("ZonCldExportCmd.") + code;
        const std::string name(code);
        if (name.find("NotInMeshFile") != std::string::npos || name.find("Active") != std::string::npos) {
            EXPECT_FALSE(ZonMsgCatalog::Lookup("ZonCldExportCmd", exportKey).empty()) << exportKey;
        }
    }
    EXPECT_FALSE(ZonMsgCatalog::Lookup(ZonCloudOperErrorTool::Catalog, ZonCloudOperErrorTool::InsufficientMemoryKey).empty());
}

TEST(ErrorTool, CatalogTexts)
{
    EXPECT_EQ(ZonCloudReadNLSTool::NameOfFormat("CloudFactoryArcInfoGrid").ToUtf8(), "ArcInfoGrid");
    EXPECT_EQ(ZonCloudReadNLSTool::NameOfFormat("CloudFactorySRTM").ToUtf8(), "Srtm");
    EXPECT_EQ(ZonCloudReadNLSTool::NameOfFormat("CloudFactoryCgoAscii").ToUtf8(), "Cgo");
    EXPECT_TRUE(ZonCloudReadNLSTool::NameOfFormat("CloudFactoryNoSuchThing").IsNull());
    EXPECT_TRUE(ZonCloudReadNLSTool::NameOfFormat(nullptr).IsNull());
    EXPECT_FALSE(ZonCloudReadNLSTool::GeneratedBy().IsNull());
    EXPECT_STREQ(ZonCloudReadNLSTool::Catalog(), "ZonCloudImportExport");
    EXPECT_EQ(ZonMsgCatalog::Lookup("NoSuchCatalog", "x"), "");
    EXPECT_EQ(ZonMsgCatalog::Build("ZonCldExportCmd", "ZonCldExportCmd.ERR_FILESUCCESSFULL", {"/tmp/a.stl"}),
              "/tmp/a.stl was written.");
}

TEST(ErrorTool, CatalogFileParsing)
{
    ZonMsgCatalog::RegisterEmbedded("TestCatalog",
                                    "// comment\n\nA.B = \"one \\\"two\\\"\\nthree\";\r\nbroken line\nC = \"{2}-{1}\";\n");
    EXPECT_EQ(ZonMsgCatalog::Lookup("TestCatalog", "A.B"), "one \"two\"\nthree");
    EXPECT_EQ(ZonMsgCatalog::Build("TestCatalog", "C", {"x", "y"}), "y-x");
    EXPECT_EQ(ZonMsgCatalog::Keys("TestCatalog"), (std::vector<std::string>{"A.B", "C"}));
}

TEST(ErrorTool, ReportingGoesToTheSessionReporter)
{
    auto collector = std::make_shared<ZonCollectingReporter>();
    ZonSession::GetPtrSession()->SetReporter(collector);
    ZonCloudReadNLSTool::FullReporterErrorList(3, "ERR_NoPointFound");
    try {
        ZonCloudReadNLSTool::Throw(0, "ERR_NotAGridDigit");
    } catch (ZonError& e) {
        ZonCloudReadNLSTool::FullReporterErrorList(&e);
    }
    const auto entries = collector->Entries();
    ASSERT_EQ(entries.size(), 2u);
    EXPECT_EQ(entries[0].key, "ZonCloudReadNLSTool.ERR_NoPointFound");
    EXPECT_EQ(entries[1].key, "ZonCloudReadNLSTool.ERR_NotAGridDigit");
    EXPECT_EQ(entries[1].severity, 1);

    // Without a session nothing is reported, and nothing fails.
    ZonSession::CloseSession();
    EXPECT_NO_THROW(ZonCloudReadNLSTool::FullReporterErrorList(3, "ERR_NoPointFound"));
    ZonSession::OpenSession();
    EXPECT_EQ(collector->Entries().size(), 2u);
}

TEST(ErrorTool, MemoryErrorHasItsOwnCatalogAndSeverity)
{
    try {
        ZonCloudOperErrorTool::ThrowInsufficientMemory();
    } catch (const ZonError& e) {
        EXPECT_EQ(e.GetCatalogName(), "ZonCldResOperError");
        EXPECT_EQ(e.GetMessageKey(), "ZonCloudOperErrorTool.ERR_InsufficientMemory");
        EXPECT_EQ(e.GetSeverity(), 4);
    }
}

}  // namespace
