// Temporary files renamed over their targets, and the library's profiles.
#include "OutputFiles.h"

#include "OutputFile.h"
#include "ToolError.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <atomic>
#include <cerrno>
#include <chrono>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <sstream>

namespace veltmarquist::python {

namespace {

[[noreturn]] void unwritable(const std::string& path, const std::string& what)
{
    throw ToolError(Failure::OutputUnwritable, path + ": " + what);
}

std::string systemError()
{
    return std::strerror(errno);
}

// A fresh name for each temporary file of the process, also across threads.
std::string uniqueSuffix()
{
    static std::atomic<unsigned long> counter{0};
    static const char digits[] = "0123456789abcdefghijklmnopqrstuvwxyz";
    unsigned long value = static_cast<unsigned long>(::getpid()) * 7919UL + counter++ * 104729UL +
                          static_cast<unsigned long>(std::chrono::steady_clock::now().time_since_epoch().count());
    std::string suffix;
    for (int i = 0; i < 6; ++i, value /= 36)
        suffix += digits[value % 36];
    return suffix;
}

// Creates the temporary file exclusively, with the mode a new file gets
// (0666 less the umask).
std::string createTemporary(const std::string& folder, const std::string& name, const std::string& path)
{
    for (int attempt = 0; attempt < 100; ++attempt) {
        const std::string candidate = folder + "." + name + ".tmp-" + uniqueSuffix();
        const int descriptor = ::open(candidate.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0666);
        if (descriptor >= 0) {
            ::close(descriptor);
            return candidate;
        }
        if (errno != EEXIST)
            unwritable(path, "cannot create a file in " + (folder.empty() ? std::string(".") : folder) + ": " +
                                 systemError());
    }
    unwritable(path, "cannot create a temporary file beside it");
}

void writeAll(const std::string& file, const std::string& text, int flags, const std::string& path)
{
    const int descriptor = ::open(file.c_str(), flags | O_CLOEXEC, 0666);
    if (descriptor < 0)
        unwritable(path, "cannot open: " + systemError());
    const int failure = writeFully(descriptor, text.data(), text.size());
    if (::close(descriptor) != 0 && failure == 0)
        unwritable(path, "write failed: " + systemError());
    if (failure != 0)
        unwritable(path, std::string("write failed: ") + std::strerror(failure));
}

// The file a path names through its symbolic links (a dangling link names
// the file it would create).
std::string followLinks(const std::string& path)
{
    namespace fs = std::filesystem;
    fs::path target(path);
    std::error_code error;
    for (int depth = 0; depth < 40; ++depth) {
        if (!fs::is_symlink(target, error))
            return target.string();
        const fs::path link = fs::read_symlink(target, error);
        if (error)
            return target.string(); // changed under us: the writing will say what is wrong
        target = link.is_absolute() ? link : target.parent_path() / link;
    }
    unwritable(path, "too many levels of symbolic links");
}

} // namespace

AtomicFile::AtomicFile(std::string path) : path_(std::move(path))
{
    namespace fs = std::filesystem;
    if (path_.empty())
        unwritable(path_, "empty output path");
    target_ = followLinks(path_);
    struct stat status {};
    const bool exists = ::stat(target_.c_str(), &status) == 0;
    if (exists && S_ISDIR(status.st_mode))
        unwritable(path_, "is a folder; give a file name");
    if (exists && ::access(target_.c_str(), W_OK) != 0)
        unwritable(path_, "is read-only; not replaced");
    intoTarget_ = exists && !S_ISREG(status.st_mode);
    const fs::path target(target_);
    if (intoTarget_) {
        const char* folder = std::getenv("TMPDIR");
        temporary_ = createTemporary(std::string(folder != nullptr && *folder != '\0' ? folder : "/tmp") + "/",
                                     "veltmarquist", path_);
        return;
    }
    const std::string folder = target.has_parent_path() ? target.parent_path().string() + "/" : "";
    // A name too long to take the temporary suffix gives its place to the tool's.
    const std::string name = target.filename().string();
    temporary_ = createTemporary(folder, name.size() > 200 ? "veltmarquist" : name, path_);
    if (exists)
        ::chmod(temporary_.c_str(), status.st_mode & 07777);
}

AtomicFile::~AtomicFile()
{
    if (!committed_)
        ::unlink(temporary_.c_str());
}

void AtomicFile::write(const std::string& text)
{
    refuseNonFiniteData(text, path_);
    writeAll(temporary_, text, O_WRONLY | O_TRUNC, path_);
}

void AtomicFile::checkLibraryChart() const
{
    std::ifstream in(temporary_, std::ios::binary);
    std::ostringstream text;
    text << in.rdbuf();
    const std::string chart = text.str();
    const std::string end = "END_DATA\n";
    if (!in || chart.size() < end.size() || chart.compare(chart.size() - end.size(), end.size(), end) != 0)
        unwritable(path_, "the chart was not written completely (disk full?)");
    refuseNonFiniteData(chart, path_);
}

void AtomicFile::commit()
{
    if (intoTarget_) {
        std::ifstream in(temporary_, std::ios::binary);
        std::ostringstream text;
        text << in.rdbuf();
        writeAll(target_, text.str(), O_WRONLY, path_);
    } else if (::rename(temporary_.c_str(), target_.c_str()) != 0) {
        unwritable(path_, "cannot replace: " + systemError());
    }
    if (intoTarget_)
        ::unlink(temporary_.c_str());
    committed_ = true;
}

// ---- Profiles ----------------------------------------------------------------------------

LibraryProfile::LibraryProfile(const std::string& name) : handle_(CreateMathProfile(name.c_str()))
{
    if (handle_ == nullptr)
        throw ToolError(Failure::Calculation, "the library could not create a profile");
}

LibraryProfile::~LibraryProfile()
{
    DestroyMathProfile(handle_);
}

void LibraryProfile::calculate(PrintProcess process, const AtomicFile& output, MeasurementBlock& block)
{
    if (handle_ == nullptr)
        throw ToolError(Failure::Calculation, "the profile is gone after an earlier failure; start again");
    const int status = CalculateChart(handle_, process, output.temporaryPath().c_str(), block.ints.data(),
                                      block.inputKind, block.firstWavelength, block.valuesPerPatch, block.count);
    if (status == VM_STATUS_FILE_NOT_OPENED || status == VM_STATUS_CALCULATION_FAILED)
        handle_ = nullptr;
    if (status == VM_STATUS_OK)
        return output.checkLibraryChart();
    if (status == VM_STATUS_FILE_NOT_OPENED)
        throw ToolError(Failure::OutputUnwritable, "the library could not open the chart file");
    throw ToolError(Failure::Calculation, status == VM_STATUS_OUT_OF_MEMORY ? "the library ran out of memory (status 5)"
                                          : status == VM_STATUS_CALCULATION_FAILED
                                              ? "the calculation failed (status 3)"
                                              : "the library rejected the measurement block (status " +
                                                    std::to_string(status) + ")");
}

} // namespace veltmarquist::python
