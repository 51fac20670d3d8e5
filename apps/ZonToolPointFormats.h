#pragma once
#include <string>

#include <CLI/CLI.hpp>

class ZonCldBody;

// zoncloud convert's writers of the text point formats: ASCII user format
// (".asc_fmt"), RGB points (".asc_rgb", ".xyz_rgb") and Cgo (".cgo"). Every
// point of the body goes into one cloud: clouds (with their colours), scans,
// the valid points of grids and the vertices of meshes.

// The user format's seven layout settings, each given as the setting's own
// text ("N" for none).
struct ZonToolUserFormatOptions {
    std::string header = "N";
    std::string name = "N";
    std::string rowSeparator = "N";
    std::string columnSeparator = "N";
    std::string pointNumbers = "N";
    std::string width = "12";
    std::string decimals = "3";

    void AddTo(CLI::App& command);
};

int ZonToolWriteUserFormat(const ZonCldBody& body, const std::string& file, const ZonToolUserFormatOptions& options);
int ZonToolWriteRgbPoints(const ZonCldBody& body, const std::string& file);
int ZonToolWriteCgo(const ZonCldBody& body, const std::string& file);
