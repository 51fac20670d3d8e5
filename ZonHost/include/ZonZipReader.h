#pragma once
#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

#include "ZonHostExport.h"

struct zip;

// The host's zip service, reading side: browses an archive (a file, or bytes
// in memory) and extracts one member into memory. Nothing is written to disk.
// Failures raise ZonCloudOperErrors of the catalog "ZonCldResOperError" with
// "ZonZipReader." keys. A member whose declared size the archive cannot
// justify (more than deflate can expand its compressed bytes to, counting no
// more compressed bytes than the archive holds, or more than the caller's
// limit) is refused before anything is allocated, and a
// member that inflates beyond its declared size is refused while it is read.
class ZON_HOST_API ZonZipReader {
public:
    struct Member {
        std::uint64_t index = 0;
        std::string name;
        std::uint64_t size = 0;            // declared, uncompressed
        std::uint64_t compressedSize = 0;  // declared
        bool isDirectory = false;
    };

    // Opens an archive file read-only.
    explicit ZonZipReader(const std::string& path);
    // Reads the archive from `size` bytes at `data`, which the caller keeps alive.
    ZonZipReader(const void* data, std::size_t size);
    ~ZonZipReader();
    ZonZipReader(const ZonZipReader&) = delete;
    ZonZipReader& operator=(const ZonZipReader&) = delete;

    // Every entry of the central directory, in archive order.
    const std::vector<Member>& Members() const { return _members; }
    // The member's bytes; refused when its declared size is above `limit`.
    std::vector<unsigned char> Extract(const Member& member, std::uint64_t limit) const;

    // The largest expansion of deflated data (its format caps it near 1032:1).
    static constexpr std::uint64_t MaxDeflateRatio = 1032;

private:
    void Browse();

    zip* _archive = nullptr;
    std::uint64_t _archiveSize = UINT64_MAX;  // in bytes; unknown: no bound
    std::vector<Member> _members;
};
