#include "ZonZipReader.h"

#include <zip.h>

#include <algorithm>
#include <filesystem>
#include <new>

#include "ZonCloudOperErrorTool.h"
#include "ZonError.h"

namespace {

[[noreturn]] void Raise(const char* key, const std::string& detail)
{
    ZonCloudOperError error(std::string("ZonZipReader.") + key, ZonCloudOperErrorTool::Catalog);
    error.SetSeverity(2);
    error.SetParameters({detail});
    error.SetSource(__FILE__, __LINE__);
    throw error;
}

std::string ErrorText(int code)
{
    zip_error_t error;
    zip_error_init_with_code(&error, code);
    std::string text = zip_error_strerror(&error);
    zip_error_fini(&error);
    return text;
}

// Closes a member however its reading ends.
struct MemberFile {
    zip_file_t* file;
    ~MemberFile()
    {
        if (file) zip_fclose(file);
    }
};

}  // namespace

ZonZipReader::ZonZipReader(const std::string& path)
{
    int code = 0;
    _archive = zip_open(path.c_str(), ZIP_RDONLY, &code);
    if (!_archive) Raise("ERR_Open", ErrorText(code));
    std::error_code sizeError;
    const auto size = std::filesystem::file_size(path, sizeError);
    if (!sizeError) _archiveSize = static_cast<std::uint64_t>(size);
    Browse();
}

ZonZipReader::ZonZipReader(const void* data, std::size_t size) : _archiveSize(size)
{
    zip_error_t error;
    zip_error_init(&error);
    zip_source_t* source = zip_source_buffer_create(data, size, 0, &error);
    if (source) {
        _archive = zip_open_from_source(source, ZIP_RDONLY, &error);
        // On success the archive owns the source; on failure it is still ours.
        if (!_archive) zip_source_free(source);
    }
    if (!_archive) {
        const std::string text = zip_error_strerror(&error);
        zip_error_fini(&error);
        Raise("ERR_Open", text);
    }
    zip_error_fini(&error);
    Browse();
}

ZonZipReader::~ZonZipReader()
{
    if (_archive) zip_discard(_archive);
}

void ZonZipReader::Browse()
{
    try {
        const zip_int64_t count = zip_get_num_entries(_archive, 0);
        for (zip_int64_t i = 0; i < count; ++i) {
            zip_stat_t stat;
            zip_stat_init(&stat);
            if (zip_stat_index(_archive, static_cast<zip_uint64_t>(i), 0, &stat) != 0)
                Raise("ERR_Member", zip_strerror(_archive));
            Member member;
            member.index = static_cast<std::uint64_t>(i);
            if (stat.valid & ZIP_STAT_NAME) member.name = stat.name;
            if (stat.valid & ZIP_STAT_SIZE) member.size = stat.size;
            if (stat.valid & ZIP_STAT_COMP_SIZE) member.compressedSize = stat.comp_size;
            member.isDirectory = !member.name.empty() && member.name.back() == '/';
            _members.push_back(std::move(member));
        }
    } catch (const std::bad_alloc&) {
        zip_discard(_archive);
        _archive = nullptr;
        ZonCloudOperErrorTool::ThrowInsufficientMemory();
    } catch (...) {
        zip_discard(_archive);
        _archive = nullptr;
        throw;
    }
}

std::vector<unsigned char> ZonZipReader::Extract(const Member& member, std::uint64_t limit) const
{
    // Stored members hold their size; deflated ones expand at most
    // MaxDeflateRatio times. The central directory's compressed size is the
    // archive's word too: no member holds more bytes than the whole archive.
    const std::uint64_t compressed = std::min(member.compressedSize, _archiveSize);
    const std::uint64_t justified =
        compressed > (UINT64_MAX - 64) / MaxDeflateRatio ? UINT64_MAX : compressed * MaxDeflateRatio + 64;
    if (member.size > limit || member.size > justified) Raise("ERR_TooLarge", member.name);

    MemberFile file{zip_fopen_index(_archive, member.index, 0)};
    if (!file.file) Raise("ERR_Member", member.name + ": " + zip_strerror(_archive));
    std::vector<unsigned char> bytes;
    try {
        bytes.resize(static_cast<std::size_t>(member.size));
    } catch (const std::bad_alloc&) {
        ZonCloudOperErrorTool::ThrowInsufficientMemory();
    }
    std::uint64_t done = 0;
    while (done < member.size) {
        const zip_int64_t got = zip_fread(file.file, bytes.data() + done, member.size - done);
        if (got < 0) Raise("ERR_Member", member.name + ": " + zip_file_strerror(file.file));
        if (got == 0) Raise("ERR_Member", member.name);
        done += static_cast<std::uint64_t>(got);
    }
    // A member that holds more than it declares is damaged or hostile: it is not read on.
    unsigned char extra = 0;
    if (zip_fread(file.file, &extra, 1) != 0) Raise("ERR_TooLarge", member.name);
    return bytes;
}
