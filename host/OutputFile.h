// Outputs of the tool: no half-written or non-finite file ever stands under
// the final name, and an output path behaves as users of Unix tools expect.
#ifndef VELTMARQUIST_TOOL_OUTPUTFILE_H
#define VELTMARQUIST_TOOL_OUTPUTFILE_H

#include <cstddef>
#include <functional>
#include <ostream>
#include <string>
#include <vector>

namespace veltmarquist {

// For a program of its own (the tool, not a host such as the Python module):
// from now on SIGINT, SIGTERM and SIGHUP remove the temporary files of every
// pending output before the process ends with the signal's status, and a
// reader of standard output or a FIFO that goes away ends the process
// quietly with the status of SIGPIPE, as a filter does. Call it once, first.
void cleanUpTemporariesOnSignals();

// "-" names standard output.
bool isStandardOutput(const std::string& path);

// Refuses the outputs of a run before anything is read or written:
// - an output that is the same file as one of the inputs (device and inode,
//   through symbolic links), two outputs on the same file or both on
//   standard output (Failure::Usage); character devices such as /dev/null
//   may take several outputs;
// - an output path that can name no output (Failure::Usage, as a path given
//   by mistake): a folder, a socket, a block device, or a symbolic link that
//   names no file (written through, it would create a file where the user
//   did not ask).
// Empty paths are outputs the run does not write.
void refuseClashingOutputs(const std::vector<std::string>& inputs, const std::vector<std::string>& outputs);

// An output that appears only when complete and checked. The constructor
// creates a temporary file; writers (the library, or write()) fill it, the
// checks read it, and commit() delivers it:
// - a new or existing regular file: the temporary file lies beside the
//   target (same file system) and is renamed over it. An existing file keeps
//   its mode, and its owner and group where the system permits; other hard
//   links to it keep the old contents. A file we may not write is refused,
//   as cp refuses it without -f.
// - a symbolic link to a file: written through to that file, the link
//   itself stays; a link that names no file is refused.
// - standard output ("-"), a FIFO or a character device: the temporary file
//   lies in $TMPDIR (or /tmp) and is copied into the target, which is never
//   replaced. A folder, a socket or a block device is refused.
// Without commit, or when the process is interrupted (SIGINT, SIGTERM,
// SIGHUP, with cleanUpTemporariesOnSignals), the temporary file is removed
// and the target stays untouched.
class PendingOutput {
public:
    // Failure::Usage for an empty path or one that can name no output (as
    // refuseClashingOutputs), OutputUnwritable when the file cannot be made.
    explicit PendingOutput(std::string path);
    ~PendingOutput();
    PendingOutput(const PendingOutput&) = delete;
    PendingOutput& operator=(const PendingOutput&) = delete;

    // The path as given, and how messages name it ("standard output" for "-").
    const std::string& path() const { return path_; }
    std::string name() const;
    const std::string& temporaryPath() const { return temporary_; }

    // Writes `text` to the temporary file (the tool's own files); refuses a
    // text whose data holds a non-finite number.
    void write(const std::string& text);
    // Writes a binary file (an ICC profile) to the temporary file as it is.
    void writeBytes(const std::string& bytes);
    // Writes what `produce` streams into the temporary file, for text too
    // large to hold (a chart export, which checks its numbers before it
    // formats them). A throw from `produce` leaves the target untouched.
    void writeStreamed(const std::function<void(std::ostream&)>& produce);
    // Checks the library's chart in the temporary file: it ends with
    // "END_DATA" and a newline (the library does not see write errors such
    // as a full disk, so they surface here), and every value of its data is
    // finite (Failure::Calculation naming the first patch that is not).
    void checkChart() const;
    void commit();

private:
    void deliverByCopy();

    std::string path_;
    std::string target_; // symbolic links resolved
    std::string temporary_;
    bool copy_ = false;  // standard output, FIFO or device
    int slot_ = -1;      // the temporary file's place in the interruption registry
    bool committed_ = false;
};

// Delivers `output` when there is one (commit) and sets `written` to how
// messages name it; does nothing for null.
void deliver(PendingOutput* output, std::string& written);

// Throws Failure::Calculation when the data of a chart or CGATS text (the
// lines between BEGIN_DATA and END_DATA) holds a value that is not finite
// (nan, inf, in any case and sign). The message names `what`, the first such
// patch by number and device values, and the field.
void refuseNonFiniteData(const std::string& text, const std::string& what);

// Writes all `size` bytes to a descriptor, resuming after interruptions and
// short writes. Returns 0, or the error number of the failed write.
int writeFully(int descriptor, const char* data, size_t size);

} // namespace veltmarquist

#endif // VELTMARQUIST_TOOL_OUTPUTFILE_H
