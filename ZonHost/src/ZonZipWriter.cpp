#include "ZonZipWriter.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>
#include <zip.h>

#include <cerrno>
#include <cstdio>
#include <random>

#include "ZonCloudOperErrorTool.h"
#include "ZonError.h"

namespace {

[[noreturn]] void RaiseSystem(int reason)
{
    ZonCloudOperError error(ZonCloudOperErrorTool::KeyFromErrno(reason != 0 ? reason : EIO),
                            ZonCloudOperErrorTool::Catalog);
    error.SetSeverity(4);
    error.SetSource(__FILE__, __LINE__);
    throw error;
}

// The zip library's error: the system's when it has one, else its own text.
[[noreturn]] void RaiseZip(zip_error_t* zipError, const std::string& archive, bool owned = false)
{
    const int system = zip_error_system_type(zipError) == ZIP_ET_SYS ? zip_error_code_system(zipError) : 0;
    const std::string reason = zip_error_strerror(zipError);
    if (owned) zip_error_fini(zipError);
    if (system != 0) RaiseSystem(system);
    ZonCloudOperError error("ZonZipWriter.ERR_Archive", ZonCloudOperErrorTool::Catalog);
    error.SetParameters({archive, reason});
    error.SetSeverity(4);
    error.SetSource(__FILE__, __LINE__);
    throw error;
}

// A fresh name beside the target, created empty with the mode any new file
// gets (so the archive does not end up with a temporary file's 0600).
std::string CreateTemporary(const std::string& target)
{
    std::random_device seed;
    for (int attempt = 0; attempt < 100; ++attempt) {
        char suffix[24];
        std::snprintf(suffix, sizeof suffix, ".%08x.tmp", static_cast<unsigned>(seed()));
        const std::string name = target + suffix;
        const int fd = ::open(name.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0666);
        if (fd >= 0) {
            ::close(fd);
            return name;
        }
        if (errno != EEXIST) RaiseSystem(errno);
    }
    RaiseSystem(EEXIST);
}

}  // namespace

void ZonZipWriter::AddFile(const std::string& name, const std::string& path) { members_.emplace_back(name, path); }

void ZonZipWriter::Commit()
{
    // Renaming onto a directory would fail only after all the work.
    struct stat status;
    if (::stat(target_.c_str(), &status) == 0 && S_ISDIR(status.st_mode)) RaiseSystem(EISDIR);

    const std::string temporary = CreateTemporary(target_);
    zip_t* archive = nullptr;
    try {
        int code = 0;
        archive = zip_open(temporary.c_str(), ZIP_TRUNCATE, &code);
        if (!archive) {
            zip_error_t error;
            zip_error_init_with_code(&error, code);
            RaiseZip(&error, target_, true);
        }
        for (const auto& [name, path] : members_) {
            zip_source_t* source = zip_source_file(archive, path.c_str(), 0, -1);
            if (!source) RaiseZip(zip_get_error(archive), target_);
            const zip_int64_t index = zip_file_add(archive, name.c_str(), source, ZIP_FL_ENC_UTF_8);
            if (index < 0) {
                zip_source_free(source);
                RaiseZip(zip_get_error(archive), target_);
            }
            if (zip_set_file_compression(archive, static_cast<zip_uint64_t>(index), ZIP_CM_DEFLATE,
                                         static_cast<zip_uint32_t>(level_)) != 0)
                RaiseZip(zip_get_error(archive), target_);
        }
        // The members are read, deflated and written here.
        if (zip_close(archive) != 0) RaiseZip(zip_get_error(archive), target_);
        archive = nullptr;
        if (std::rename(temporary.c_str(), target_.c_str()) != 0) RaiseSystem(errno);
    } catch (...) {
        if (archive) zip_discard(archive);
        std::remove(temporary.c_str());
        throw;
    }
}
