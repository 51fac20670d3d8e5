#include <unistd.h>

#include <cstdio>
#include <filesystem>

#include "ZonCloudTool.h"

namespace {
constexpr auto Delay = std::chrono::seconds(1);           // quick work shows nothing
constexpr auto Period = std::chrono::milliseconds(100);
constexpr int Width = 30;
}  // namespace

ZonToolProgress::ZonToolProgress(const std::string& file)
{
    if (!::isatty(STDERR_FILENO)) return;
    std::error_code error;
    const auto size = std::filesystem::file_size(file, error);
    _size = error ? 0 : static_cast<std::uint64_t>(size);
    _painter = std::thread([this] { Paint(); });
}

ZonToolProgress::~ZonToolProgress()
{
    if (!_painter.joinable()) return;
    {
        std::lock_guard lock(_mutex);
        _done = true;
    }
    _wake.notify_one();
    _painter.join();
}

void ZonToolProgress::Paint()
{
    const auto start = std::chrono::steady_clock::now();
    bool drawn = false;
    std::unique_lock lock(_mutex);
    while (!_wake.wait_for(lock, Period, [this] { return _done; })) {
        if (std::chrono::steady_clock::now() - start < Delay) continue;
        const double megabytes = static_cast<double>(_counter.BytesRead()) / 1e6;
        if (_size == 0) {
            std::fprintf(stderr, "\rreading: %.1f MB", megabytes);
        } else {
            // A reader that reads its file twice stays full for its second pass.
            const double share = std::min(1.0, megabytes / (static_cast<double>(_size) / 1e6));
            const int filled = static_cast<int>(share * Width);
            std::fprintf(stderr, "\r[%.*s%*s] %3d %% of %.1f MB", filled, "##############################",
                         Width - filled, "", static_cast<int>(share * 100), static_cast<double>(_size) / 1e6);
        }
        std::fflush(stderr);
        drawn = true;
    }
    // The line is cleared, so what follows on the terminal starts clean.
    if (drawn) std::fprintf(stderr, "\r%*s\r", Width + 24, "");
}
