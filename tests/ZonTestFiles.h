// Scaffolding of the tests that work on files: a fresh directory per test,
// files written from bytes and read back, and the tool run with its output
// and exit status captured.
#pragma once
#include <gtest/gtest.h>
#include <sys/wait.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <functional>
#include <sstream>
#include <string>
#include <type_traits>
#include <vector>

#include "ZonError.h"

namespace zontest {

inline std::string Slurp(const std::string& path)
{
    std::ifstream in(path, std::ios::binary);
    std::ostringstream text;
    text << in.rdbuf();
    return text.str();
}

inline std::string Quote(const std::string& s) { return "'" + s + "'"; }

// `piece` written `times` times, for files of many lines.
inline std::string Repeat(const std::string& piece, int times)
{
    std::string text;
    for (int i = 0; i < times; ++i) text += piece;
    return text;
}

// The catalog key of the error `call` raises; "" when it raises none.
inline std::string ErrorKey(const std::function<void()>& call)
{
    try {
        call();
    } catch (const ZonError& error) {
        return error.GetMessageKey();
    }
    return "";
}

// The same as "key/severity", for tests that pin the error's type too.
inline std::string ErrorKeyAndSeverity(const std::function<void()>& call)
{
    try {
        call();
    } catch (const ZonError& error) {
        return error.GetMessageKey() + "/" + std::to_string(error.GetSeverity());
    }
    return "";
}

// The points a reader gives, in double (the default) or single precision.
template <class T = double, class Reader>
std::vector<T> PointsOf(Reader& reader)
{
    unsigned n = 0;
    const T* p = nullptr;
    if constexpr (std::is_same_v<T, double>)
        p = reader.GetPointsDouble(n);
    else
        p = reader.GetPoints(n);
    return std::vector<T>(p, p + 3 * n);
}

struct ToolRun {
    int status = -1;
    std::string out, err;
};

// Each test gets its own directory, removed after it.
class FilesTest : public ::testing::Test {
protected:
    void SetUp() override
    {
        char pattern[] = "/tmp/zon_test_XXXXXX";
        ASSERT_NE(::mkdtemp(pattern), nullptr);
        dir_ = pattern;
    }
    void TearDown() override { std::filesystem::remove_all(dir_); }

    std::string Path(const std::string& name) const { return dir_ + "/" + name; }
    std::string Write(const std::string& name, const std::string& bytes) const
    {
        std::ofstream(Path(name), std::ios::binary) << bytes;
        return Path(name);
    }
    // The tool with these arguments (quoted by the caller), no standard input.
    ToolRun Run(const std::string& arguments) const
    {
        const std::string out = Path(".stdout"), err = Path(".stderr");
        const std::string command =
            Quote(ZON_TOOL_PATH) + " " + arguments + " >" + Quote(out) + " 2>" + Quote(err) + " </dev/null";
        const int raw = std::system(command.c_str());
        return {WIFEXITED(raw) ? WEXITSTATUS(raw) : -1, Slurp(out), Slurp(err)};
    }

    std::string dir_;
};

}  // namespace zontest
