// Outputs written through a temporary file in the target's folder.
#include "OutputFile.h"

#include "ToolError.h"

#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <fstream>
#include <vector>

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

PendingOutput::PendingOutput(std::string path) : path_(std::move(path))
{
    if (path_.empty())
        throw ToolError(Failure::OutputUnwritable, "empty output path");
    if (isFolder(path_))
        throw ToolError(Failure::OutputUnwritable, path_ + ": is a folder; give a file name");
    const std::string folder = folderOf(path_);
    std::string pattern = folder + "." + path_.substr(folder.size()) + ".tmp-XXXXXX";
    std::vector<char> name(pattern.begin(), pattern.end());
    name.push_back('\0');
    const int descriptor = ::mkstemp(name.data());
    if (descriptor < 0)
        throw ToolError(Failure::OutputUnwritable, path_ + ": cannot create a file in " +
                                                       (folder.empty() ? std::string("the current folder") : folder) +
                                                       ": " + std::strerror(errno));
    // mkstemp creates the file for its owner only; give it the permissions
    // of a file created the ordinary way.
    const mode_t mask = ::umask(0);
    ::umask(mask);
    if (::fchmod(descriptor, 0666 & ~mask) != 0) {
        // Not fatal: the file is still ours and complete.
    }
    ::close(descriptor);
    temporary_ = name.data();
}

PendingOutput::~PendingOutput()
{
    if (!committed_ && !temporary_.empty())
        std::remove(temporary_.c_str());
}

void PendingOutput::write(const std::string& text)
{
    std::ofstream out(temporary_, std::ios::binary | std::ios::trunc);
    out << text;
    out.close();
    if (!out)
        throw ToolError(Failure::OutputUnwritable, path_ + ": write failed (disk full?)");
}

void PendingOutput::expectCompleteChart() const
{
    std::ifstream in(temporary_, std::ios::binary | std::ios::ate);
    const std::string end = "END_DATA\n";
    const std::streamoff size = in ? static_cast<std::streamoff>(in.tellg()) : -1;
    std::string tail(end.size(), '\0');
    if (size >= static_cast<std::streamoff>(end.size())) {
        in.seekg(size - static_cast<std::streamoff>(end.size()));
        in.read(&tail[0], static_cast<std::streamsize>(tail.size()));
    }
    if (!in || tail != end)
        throw ToolError(Failure::OutputUnwritable, path_ + ": the chart was not written completely (disk full?)");
}

void PendingOutput::commit()
{
    if (std::rename(temporary_.c_str(), path_.c_str()) != 0)
        throw ToolError(Failure::OutputUnwritable, path_ + ": cannot replace: " + std::strerror(errno));
    committed_ = true;
}

} // namespace veltmarquist
