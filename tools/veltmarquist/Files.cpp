// Reading input files, writing outputs through a temporary file, and CGATS
// text of the tool's own.
#include "Files.h"

#include "ToolError.h"

#include <lcms2.h>

#include <sys/stat.h>

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <fstream>
#include <memory>
#include <sstream>

namespace veltmarquist {

namespace {

bool isFolder(const std::string& path)
{
    struct stat status {};
    return ::stat(path.c_str(), &status) == 0 && S_ISDIR(status.st_mode);
}

std::string folderOf(const std::string& path)
{
    const size_t slash = path.rfind('/');
    return slash == std::string::npos ? std::string() : path.substr(0, slash + 1);
}

} // namespace

std::string readTextFile(const std::string& path)
{
    if (isFolder(path))
        throw ToolError(Failure::InputUnreadable, path + ": is a folder, not a file");
    std::ifstream in(path, std::ios::binary);
    if (!in)
        throw ToolError(Failure::InputUnreadable, path + ": cannot open: " + std::strerror(errno));
    std::ostringstream text;
    text << in.rdbuf();
    if (in.bad())
        throw ToolError(Failure::InputUnreadable, path + ": read error");
    return text.str();
}

MeasurementFile loadMeasurementFile(const std::string& path, const ReadOptions& options)
{
    ReadResult result = readMeasurementText(readTextFile(path), options);
    if (!result.ok()) {
        const ReadError& error = result.error;
        const std::string where = error.line > 0 ? path + ":" + std::to_string(error.line) : path;
        throw ToolError(error.kind, where + ": " + error.message);
    }
    return std::move(*result.file);
}

std::string fileStem(const std::string& path)
{
    std::string base = path.substr(folderOf(path).size());
    const size_t dot = base.rfind('.');
    if (dot != std::string::npos && dot > 0)
        base.erase(dot);
    return base;
}

// ---- CGATS text ----------------------------------------------------------------------------

std::string cgatsText(const CgatsTable& table)
{
    struct Deleter {
        void operator()(void* handle) const { cmsIT8Free(handle); }
    };
    std::unique_ptr<void, Deleter> handle(cmsIT8Alloc(nullptr));
    if (!handle)
        throw ToolError(Failure::Internal, "cannot create a CGATS table");
    void* it8 = handle.get();
    bool ok = cmsIT8SetSheetType(it8, "CGATS.17");
    for (const auto& [key, value] : table.keywords)
        ok = ok && cmsIT8SetPropertyStr(it8, key.c_str(), value.c_str());
    ok = ok && cmsIT8SetPropertyDbl(it8, "NUMBER_OF_FIELDS", static_cast<double>(table.fields.size()));
    for (size_t field = 0; field < table.fields.size(); ++field)
        ok = ok && cmsIT8SetDataFormat(it8, static_cast<int>(field), table.fields[field].c_str());
    ok = ok && cmsIT8SetPropertyDbl(it8, "NUMBER_OF_SETS", static_cast<double>(table.rows.size()));
    for (size_t row = 0; row < table.rows.size(); ++row)
        for (size_t field = 0; field < table.rows[row].size(); ++field)
            ok = ok && cmsIT8SetDataRowCol(it8, static_cast<int>(row), static_cast<int>(field),
                                           table.rows[row][field].c_str());
    cmsUInt32Number size = 0;
    ok = ok && cmsIT8SaveToMem(it8, nullptr, &size);
    std::string text(size, '\0');
    ok = ok && cmsIT8SaveToMem(it8, &text[0], &size);
    if (!ok)
        throw ToolError(Failure::Internal, "cannot write a CGATS table");
    // The writer counts the terminating NUL.
    while (!text.empty() && text.back() == '\0')
        text.pop_back();
    return text;
}

} // namespace veltmarquist
