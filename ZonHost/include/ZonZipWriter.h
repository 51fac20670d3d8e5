#pragma once
#include <string>
#include <utility>
#include <vector>

#include "ZonHostExport.h"

// Writes a new zip archive from files on disk: members named with '/'
// separators, deflated. Nothing is written before Commit, which builds the
// archive under a temporary name beside the target and renames it onto the
// target only once it is complete; so a failure leaves neither a partial
// archive nor the temporary file, and a target that existed is untouched.
// Failures raise ZonErrors of the catalog "ZonCldResOperError": the system's
// error when the system refused (full disk, missing directory, no
// permission), else "ZonZipWriter.ERR_Archive" with the archive and the
// zip library's reason.
class ZON_HOST_API ZonZipWriter {
public:
    explicit ZonZipWriter(std::string target) : target_(std::move(target)) {}

    // The member `name` will hold the content of the file at `path` (read
    // at Commit). Members are stored in the order they are added.
    void AddFile(const std::string& name, const std::string& path);
    // Deflate level, 1 (fastest) to 9 (smallest); 0 is the library's default.
    void SetCompressionLevel(int level) { level_ = level; }
    void Commit();

private:
    std::string target_;
    std::vector<std::pair<std::string, std::string>> members_;
    int level_ = 0;
};
