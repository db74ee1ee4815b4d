// Outputs written through a temporary file, checked, then renamed over the
// target or copied into it.
#include "OutputFile.h"

#include "Failure.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <charconv>
#include <climits>
#include <cmath>
#include <csignal>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <sstream>
#include <utility>

namespace veltmarquist {

namespace {

// ---- Interruption ---------------------------------------------------------------------------
//
// In a program that asks for it (the tool), SIGINT, SIGTERM and SIGHUP remove
// every temporary file of the run and then end the process with the signal's
// default action, so that the caller sees the usual status. The handler may
// only call async-signal-safe functions: it reads the names from fixed
// buffers that are changed with those signals blocked, unlinks them and
// re-raises. A host with its own handling of signals and threads (the Python
// module) leaves this off: its temporary files are removed when their
// outputs go out of scope.

bool gCleanUpOnSignals = false;

constexpr int kSlots = 8; // a run has at most three outputs at once
char gTemporaryNames[kSlots][PATH_MAX];
volatile std::sig_atomic_t gSlotUsed[kSlots];
const int kInterruptions[] = {SIGINT, SIGTERM, SIGHUP};

extern "C" void removeTemporariesAndStop(int signal)
{
    for (int slot = 0; slot < kSlots; ++slot)
        if (gSlotUsed[slot] != 0)
            ::unlink(gTemporaryNames[slot]);
    struct sigaction action {};
    action.sa_handler = SIG_DFL;
    sigemptyset(&action.sa_mask);
    ::sigaction(signal, &action, nullptr);
    ::raise(signal);
    sigset_t pending;
    sigemptyset(&pending);
    sigaddset(&pending, signal);
    ::sigprocmask(SIG_UNBLOCK, &pending, nullptr);
}

// The handlers are installed with the first temporary file. A signal the
// tool was started with ignored (nohup, a background job) stays ignored.
void installHandlers()
{
    static bool installed = false;
    if (installed)
        return;
    installed = true;
    for (int signal : kInterruptions) {
        struct sigaction old {};
        if (::sigaction(signal, nullptr, &old) != 0 || old.sa_handler == SIG_IGN)
            continue;
        struct sigaction action {};
        action.sa_handler = removeTemporariesAndStop;
        sigemptyset(&action.sa_mask);
        for (int other : kInterruptions)
            sigaddset(&action.sa_mask, other);
        ::sigaction(signal, &action, nullptr);
    }
}

// Holds the interruptions back while the registry changes.
class InterruptionsHeld {
public:
    InterruptionsHeld()
    {
        sigset_t held;
        sigemptyset(&held);
        for (int signal : kInterruptions)
            sigaddset(&held, signal);
        ::sigprocmask(SIG_BLOCK, &held, &previous_);
    }
    ~InterruptionsHeld() { ::sigprocmask(SIG_SETMASK, &previous_, nullptr); }
    InterruptionsHeld(const InterruptionsHeld&) = delete;
    InterruptionsHeld& operator=(const InterruptionsHeld&) = delete;

private:
    sigset_t previous_;
};

// Creates a temporary file from `pattern` (ending in XXXXXX) and enters it in
// the registry in one step, so that no interruption can fall between.
// Returns the descriptor and sets `path` and `slot`.
int createRegisteredTemporary(const std::string& pattern, std::string& path, int& slot)
{
    if (pattern.size() >= PATH_MAX) {
        errno = ENAMETOOLONG;
        return -1;
    }
    if (!gCleanUpOnSignals) {
        std::string name = pattern;
        const int descriptor = ::mkstemp(&name[0]);
        if (descriptor >= 0)
            path = name;
        slot = -1;
        return descriptor;
    }
    installHandlers();
    InterruptionsHeld held;
    slot = 0;
    while (slot < kSlots && gSlotUsed[slot] != 0)
        ++slot;
    if (slot == kSlots)
        throw HostError(Failure::Internal, "more than " + std::to_string(kSlots) + " outputs at once");
    char* name = gTemporaryNames[slot];
    std::memcpy(name, pattern.c_str(), pattern.size() + 1);
    const int descriptor = ::mkstemp(name);
    if (descriptor >= 0) {
        gSlotUsed[slot] = 1;
        path = name;
    }
    return descriptor;
}

void unregisterTemporary(int slot)
{
    if (slot >= 0 && slot < kSlots)
        gSlotUsed[slot] = 0;
}

// ---- Targets --------------------------------------------------------------------------------

std::string folderOf(const std::string& path)
{
    const size_t slash = path.rfind('/');
    return slash == std::string::npos ? std::string() : path.substr(0, slash + 1);
}

std::string systemError()
{
    return std::strerror(errno);
}

// The file a chain of symbolic links ends in (the path itself when it is not
// a link); a relative link counts from the folder of the link.
std::string followLinks(const std::string& given)
{
    std::string path = given;
    for (int depth = 0; depth < 40; ++depth) {
        struct stat status {};
        if (::lstat(path.c_str(), &status) != 0 || !S_ISLNK(status.st_mode))
            return path;
        std::string link(static_cast<size_t>(status.st_size > 0 ? status.st_size : PATH_MAX) + 1, '\0');
        const ssize_t length = ::readlink(path.c_str(), &link[0], link.size());
        if (length < 0 || static_cast<size_t>(length) >= link.size())
            return path; // changed under us: the writing will say what is wrong
        link.resize(static_cast<size_t>(length));
        path = link.front() == '/' ? link : folderOf(path) + link;
    }
    throw HostError(Failure::OutputUnwritable, given + ": too many levels of symbolic links");
}

// How a path identifies a file: device and inode when it exists, otherwise
// its folder's real path and its name.
struct FileIdentity {
    bool exists = false;
    bool characterDevice = false;
    dev_t device = 0;
    ino_t inode = 0;
    std::string newPath;

    bool sameAs(const FileIdentity& other) const
    {
        if (exists != other.exists)
            return false;
        return exists ? device == other.device && inode == other.inode : newPath == other.newPath;
    }
};

FileIdentity identify(const std::string& given)
{
    FileIdentity identity;
    struct stat status {};
    if (isStandardOutput(given)) {
        identity.newPath = given;
    } else if (::stat(given.c_str(), &status) == 0) {
        identity.exists = true;
        identity.characterDevice = S_ISCHR(status.st_mode);
        identity.device = status.st_dev;
        identity.inode = status.st_ino;
    } else {
        const std::string target = followLinks(given);
        const std::string folder = folderOf(target);
        char* real = ::realpath(folder.empty() ? "." : folder.c_str(), nullptr);
        identity.newPath = (real != nullptr ? std::string(real) + "/" : folder) + target.substr(folder.size());
        std::free(real);
    }
    return identity;
}

// Why no output can be written to `path`, or an empty text.
std::string unusableOutput(const std::string& path)
{
    if (path.empty())
        return "an empty path names no file";
    struct stat status {};
    if (isStandardOutput(path))
        return "";
    if (::stat(path.c_str(), &status) != 0) {
        struct stat link {};
        if (::lstat(path.c_str(), &link) == 0 && S_ISLNK(link.st_mode))
            return path + ": is a symbolic link to " + followLinks(path) +
                   ", which does not exist; give that file's name or remove the link";
        return "";
    }
    if (S_ISDIR(status.st_mode))
        return path + ": is a folder; give a file name";
    if (S_ISSOCK(status.st_mode))
        return path + ": is a socket; give a file name";
    if (S_ISBLK(status.st_mode))
        return path + ": is a block device; give a file name";
    return "";
}

size_t longestName(const std::string& folder)
{
    const long limit = ::pathconf(folder.empty() ? "." : folder.c_str(), _PC_NAME_MAX);
    return limit > 0 ? static_cast<size_t>(limit) : 255;
}

} // namespace

int writeFully(int descriptor, const char* data, size_t size)
{
    while (size > 0) {
        const ssize_t written = ::write(descriptor, data, size);
        if (written < 0 && errno == EINTR)
            continue;
        if (written <= 0)
            return written < 0 ? errno : EIO;
        data += written;
        size -= static_cast<size_t>(written);
    }
    return 0;
}

namespace {

// ---- Non-finite values ----------------------------------------------------------------------

std::vector<std::string> tokens(const std::string& line)
{
    std::vector<std::string> items;
    std::istringstream in(line);
    for (std::string item; in >> item;)
        items.push_back(item);
    return items;
}

// nan, inf, infinity in any case and sign, and numbers too large for a
// double (a reader would take them as infinite); numbers too small for one
// are merely zero.
bool isNonFiniteNumber(const std::string& token)
{
    double value = 0.0;
    const char* end = token.data() + token.size();
    const auto [stop, error] = std::from_chars(token.data(), end, value);
    if (stop != end)
        return false;
    if (error == std::errc::result_out_of_range) {
        const size_t exponent = token.find_first_of("eE");
        return exponent == std::string::npos || token[exponent + 1] != '-';
    }
    return !std::isfinite(value);
}

// "C 100 M 0 Y 0 K 0" from the CMYK fields, "channels 100 0 ..." when the
// chart has more (the multi-channel charts carry channels 5 to 7 as RGB_*).
std::string describePatch(const std::vector<std::string>& fields, const std::vector<std::string>& values)
{
    std::vector<std::string> device;
    for (size_t field = 0; field < fields.size() && field < values.size(); ++field)
        if (fields[field].rfind("CMYK_", 0) == 0 || fields[field].rfind("RGB_", 0) == 0)
            device.push_back(values[field]);
    if (device.empty())
        return "";
    std::string text = device.size() == 4 ? "" : "channels";
    for (size_t channel = 0; channel < device.size(); ++channel)
        text += (device.size() == 4 ? std::string(channel == 0 ? "" : " ") + "CMYK"[channel] : std::string()) + " " +
                device[channel];
    return " (" + text + ")";
}

} // namespace

void cleanUpTemporariesOnSignals()
{
    gCleanUpOnSignals = true;
}

bool isStandardOutput(const std::string& path)
{
    return path == "-";
}

void refuseClashingOutputs(const std::vector<std::string>& inputs, const std::vector<std::string>& outputs)
{
    for (const std::string& output : outputs) {
        const std::string unusable = output.empty() ? "" : unusableOutput(output);
        if (!unusable.empty())
            throw HostError(Failure::Usage, unusable);
    }
    std::vector<std::pair<const std::string*, FileIdentity>> seen;
    for (const std::string& output : outputs) {
        if (output.empty())
            continue;
        const FileIdentity identity = identify(output);
        if (identity.characterDevice)
            continue;
        for (const std::string& input : inputs)
            if (identity.exists && !input.empty() && identify(input).sameAs(identity))
                throw HostError(Failure::Usage,
                                output + ": is the same file as the input " + input + "; give the output another name");
        for (const auto& [before, beforeIdentity] : seen)
            if (beforeIdentity.sameAs(identity))
                throw HostError(Failure::Usage, isStandardOutput(output)
                                                    ? "two outputs go to standard output; give each its own file"
                                                    : "the outputs " + *before + " and " + output +
                                                          " are the same file; give each output its own");
        seen.emplace_back(&output, identity);
    }
}

void refuseNonFiniteData(const std::string& text, const std::string& what)
{
    std::istringstream in(text);
    std::vector<std::string> fields;
    enum { Header, Format, Data } part = Header;
    size_t patch = 0;
    for (std::string line; std::getline(in, line);) {
        if (!line.empty() && line.back() == '\r')
            line.pop_back();
        const std::vector<std::string> items = tokens(line);
        const std::string first = items.empty() ? "" : items.front();
        if (part != Data && first == "BEGIN_DATA_FORMAT") {
            part = Format;
        } else if (part == Format && first == "END_DATA_FORMAT") {
            part = Header;
        } else if (part == Format) {
            fields.insert(fields.end(), items.begin(), items.end());
        } else if (part == Header && first == "BEGIN_DATA") {
            part = Data;
        } else if (part == Data && first == "END_DATA") {
            return;
        } else if (part == Data && !items.empty()) {
            ++patch;
            for (size_t item = 0; item < items.size(); ++item)
                if (isNonFiniteNumber(items[item]))
                    throw HostError(Failure::Calculation,
                                    what + ": nothing written: the calculation gave " + items[item] + " for " +
                                        (item < fields.size() ? fields[item] : "value " + std::to_string(item + 1)) +
                                        " of patch " + std::to_string(patch) + describePatch(fields, items));
        }
    }
}

PendingOutput::PendingOutput(std::string path) : path_(std::move(path))
{
    const std::string unusable = unusableOutput(path_);
    if (!unusable.empty())
        throw HostError(Failure::Usage, unusable);
    struct stat status {};
    const bool exists = !isStandardOutput(path_) && ::stat(path_.c_str(), &status) == 0;
    copy_ = isStandardOutput(path_) || (exists && !S_ISREG(status.st_mode));
    // A file we may not write is refused, not replaced behind its owner's back.
    if (exists && ::faccessat(AT_FDCWD, path_.c_str(), W_OK, AT_EACCESS) != 0)
        throw HostError(Failure::OutputUnwritable,
                        path_ + ": " + (errno == EACCES && !copy_
                                            ? std::string("is read-only; not replaced (make it writable or remove it)")
                                            : "cannot write: " + systemError()));

    std::string folder, pattern;
    if (copy_) {
        target_ = path_;
        const char* temporaryFolder = std::getenv("TMPDIR");
        folder = temporaryFolder != nullptr && *temporaryFolder != '\0' ? temporaryFolder : "/tmp";
        if (folder.back() != '/')
            folder += '/';
        pattern = folder + "veltmarquist-XXXXXX";
    } else {
        target_ = followLinks(path_);
        folder = folderOf(target_);
        const std::string name = "." + target_.substr(folder.size()) + ".tmp-XXXXXX";
        // A name near the file system's limit gets a short temporary name.
        pattern = folder + (name.size() <= longestName(folder) ? name : ".veltmarquist.tmp-XXXXXX");
    }
    const int descriptor = createRegisteredTemporary(pattern, temporary_, slot_);
    if (descriptor < 0)
        throw HostError(Failure::OutputUnwritable, path_ + ": cannot create a file in " +
                                                       (folder.empty() ? std::string("the current folder") : folder) +
                                                       ": " + systemError());
    // The replacement takes over the mode and, where permitted, the owner and
    // group of the file it replaces; a new file gets the mode of a file
    // created the ordinary way. A copied temporary file stays private.
    if (exists && !copy_) {
        if (::fchown(descriptor, status.st_uid, status.st_gid) != 0 && ::fchown(descriptor, -1, status.st_gid) != 0) {
            // Not permitted: the file becomes the user's own, as with cp.
        }
        ::fchmod(descriptor, status.st_mode & 07777);
    } else if (!copy_) {
        const mode_t mask = ::umask(0);
        ::umask(mask);
        ::fchmod(descriptor, 0666 & ~mask);
    }
    ::close(descriptor);
}

PendingOutput::~PendingOutput()
{
    if (!temporary_.empty() && !(committed_ && !copy_))
        ::unlink(temporary_.c_str());
    unregisterTemporary(slot_);
}

std::string PendingOutput::name() const
{
    return isStandardOutput(path_) ? "standard output" : path_;
}

void PendingOutput::write(const std::string& text)
{
    refuseNonFiniteData(text, name());
    writeBytes(text);
}

void PendingOutput::writeBytes(const std::string& bytes)
{
    std::ofstream out(temporary_, std::ios::binary | std::ios::trunc);
    out << bytes;
    out.close();
    if (!out)
        throw HostError(Failure::OutputUnwritable, name() + ": write failed (disk full?)");
}

void PendingOutput::writeStreamed(const std::function<void(std::ostream&)>& produce)
{
    std::ofstream out(temporary_, std::ios::binary | std::ios::trunc);
    produce(out);
    out.close();
    if (!out)
        throw HostError(Failure::OutputUnwritable, name() + ": write failed (disk full?)");
}

void PendingOutput::checkChart() const
{
    std::ifstream in(temporary_, std::ios::binary);
    std::ostringstream text;
    text << in.rdbuf();
    const std::string chart = text.str(), end = "END_DATA\n";
    if (!in || chart.size() < end.size() || chart.compare(chart.size() - end.size(), end.size(), end) != 0)
        throw HostError(Failure::OutputUnwritable, name() + ": the chart was not written completely (disk full?)");
    refuseNonFiniteData(chart, name());
}

void PendingOutput::deliverByCopy()
{
    const int source = ::open(temporary_.c_str(), O_RDONLY | O_CLOEXEC);
    // Opening a FIFO waits for its reader; a device is written, never replaced.
    const int target =
        isStandardOutput(path_) ? STDOUT_FILENO : ::open(target_.c_str(), O_WRONLY | O_NOCTTY | O_CLOEXEC);
    int failure = source < 0 || target < 0 ? errno : 0;
    char buffer[1 << 16];
    while (failure == 0) {
        const ssize_t got = ::read(source, buffer, sizeof buffer);
        if (got < 0 && errno == EINTR)
            continue;
        if (got <= 0) {
            failure = got < 0 ? errno : 0;
            break;
        }
        failure = writeFully(target, buffer, static_cast<size_t>(got));
    }
    if (source >= 0)
        ::close(source);
    if (target >= 0 && target != STDOUT_FILENO && ::close(target) != 0 && failure == 0)
        failure = errno;
    if (failure == EPIPE && gCleanUpOnSignals) {
        // The reader has gone, as with `| head`: end quietly, as a filter
        // does, with the status of SIGPIPE.
        ::unlink(temporary_.c_str());
        unregisterTemporary(slot_);
        std::signal(SIGPIPE, SIG_DFL);
        ::raise(SIGPIPE);
    }
    if (failure != 0)
        throw HostError(Failure::OutputUnwritable, name() + ": write failed: " + std::strerror(failure));
}

void deliver(PendingOutput* output, std::string& written)
{
    if (output == nullptr)
        return;
    output->commit();
    written = output->name();
}

void PendingOutput::commit()
{
    if (copy_) {
        deliverByCopy();
    } else {
        // On disk before it replaces the old file, so that a crash leaves
        // the one or the other.
        const int descriptor = ::open(temporary_.c_str(), O_RDONLY | O_CLOEXEC);
        if (descriptor < 0 || ::fsync(descriptor) != 0) {
            const std::string reason = systemError();
            if (descriptor >= 0)
                ::close(descriptor);
            throw HostError(Failure::OutputUnwritable, name() + ": write failed: " + reason);
        }
        ::close(descriptor);
        if (std::rename(temporary_.c_str(), target_.c_str()) != 0)
            throw HostError(Failure::OutputUnwritable, name() + ": cannot replace: " + systemError());
        unregisterTemporary(slot_);
    }
    committed_ = true;
}

} // namespace veltmarquist
