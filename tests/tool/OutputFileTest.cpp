// The tool's outputs: where each kind of target is delivered, what is refused, and that nothing is left behind.
#include "../TestSupport.h"
#include "OutputFile.h"
#include "ToolError.h"

#include <gtest/gtest.h>

#include <fcntl.h>
#include <spawn.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <csignal>
#include <filesystem>
#include <fstream>
#include <functional>
#include <thread>

using namespace veltmarquist;
namespace ts = testsupport;
namespace fs = std::filesystem;

namespace {

const char* const kForm = VELTMARQUIST_SAMPLES_DIR "/offset_form.txt";

long entries(const std::string& dir) { return std::distance(fs::directory_iterator(dir), fs::directory_iterator()); }

// Starts the built tool with TMPDIR=dir/tmp, default signal actions and stdout to `out`.
pid_t startTool(const std::vector<std::string>& arguments, const std::string& dir, const std::string& out)
{
    std::vector<char*> argv{const_cast<char*>(VELTMARQUIST_TOOL)};
    for (const std::string& argument : arguments)
        argv.push_back(const_cast<char*>(argument.c_str()));
    argv.push_back(nullptr);
    std::string temporary = "TMPDIR=" + dir + "/tmp";
    char* environment[] = {temporary.data(), nullptr};
    posix_spawn_file_actions_t files;
    posix_spawn_file_actions_init(&files);
    posix_spawn_file_actions_addopen(&files, STDOUT_FILENO, out.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0644);
    posix_spawn_file_actions_addopen(&files, STDERR_FILENO, "/dev/null", O_WRONLY, 0);
    posix_spawnattr_t attributes;
    posix_spawnattr_init(&attributes);
    sigset_t all;
    sigfillset(&all);
    posix_spawnattr_setsigdefault(&attributes, &all);
    posix_spawnattr_setflags(&attributes, POSIX_SPAWN_SETSIGDEF);
    pid_t pid = -1;
    posix_spawn(&pid, argv[0], &files, &attributes, argv.data(), environment);
    posix_spawn_file_actions_destroy(&files);
    posix_spawnattr_destroy(&attributes);
    return pid;
}

} // namespace

TEST(OutputFile, EachKindOfTargetIsDeliveredLikeUnixToolsDo)
{
    struct Case {
        const char* name;
        std::function<std::string(const ts::TempDir&)> prepare; // returns the output path
        std::function<void(const ts::TempDir&)> check;
    };
    std::string fromFifo;
    std::thread reader;
    const std::string longName = std::string(248, 'n') + ".txt";
    const Case cases[] = {
        {"symlink written through", [](const ts::TempDir& dir) {
             std::ofstream(dir.path("target.txt")) << "old\n";
             fs::create_symlink("target.txt", dir.path("link.txt"));
             return dir.path("link.txt");
         }, [](const ts::TempDir& dir) {
             EXPECT_EQ(ts::readFile(dir.path("target.txt")), "new\n");
             EXPECT_TRUE(fs::is_symlink(dir.path("link.txt")));
         }},
        {"mode kept", [](const ts::TempDir& dir) {
             std::ofstream(dir.path("kept.txt")) << "old\n";
             fs::permissions(dir.path("kept.txt"), fs::perms(0640));
             return dir.path("kept.txt");
         }, [](const ts::TempDir& dir) {
             EXPECT_EQ(fs::status(dir.path("kept.txt")).permissions(), fs::perms(0640));
         }},
        {"FIFO written, not replaced", [&](const ts::TempDir& dir) {
             mkfifo(dir.path("fifo").c_str(), 0600);
             reader = std::thread([&fromFifo, path = dir.path("fifo")] { fromFifo = ts::readFile(path); });
             return dir.path("fifo");
         }, [&](const ts::TempDir& dir) {
             reader.join();
             EXPECT_EQ(fromFifo, "new\n");
             EXPECT_TRUE(fs::is_fifo(dir.path("fifo")));
         }},
        {"name at the file system's limit", [&](const ts::TempDir& dir) { return dir.path(longName); },
         [&](const ts::TempDir& dir) { EXPECT_EQ(ts::readFile(dir.path(longName)), "new\n"); }},
    };
    for (const Case& test : cases) {
        SCOPED_TRACE(test.name);
        ts::TempDir dir;
        fs::create_directory(dir.path("tmp"));
        setenv("TMPDIR", dir.path("tmp").c_str(), 1);
        {
            PendingOutput output(test.prepare(dir));
            output.write("new\n");
            output.commit();
        }
        test.check(dir);
        EXPECT_EQ(entries(dir.path("tmp")), 0) << "a temporary file was left";
    }
    unsetenv("TMPDIR");
}

TEST(OutputFile, ClashingOutputsAreRefusedBeforeAnythingIsWritten)
{
    ts::TempDir dir;
    std::ofstream(dir.path("form.txt")) << "measurements\n";
    fs::create_symlink("form.txt", dir.path("link.txt"));
    fs::create_hard_link(dir.path("form.txt"), dir.path("hard.txt"));
    const std::string form = dir.path("form.txt");
    const std::tuple<const char*, std::vector<std::string>, std::vector<std::string>, bool> cases[] = {
        {"output through a symlink to the input", {form}, {dir.path("link.txt")}, true},
        {"output a hard link of the input", {form}, {dir.path("hard.txt")}, true},
        {"two new outputs on one path", {form}, {dir.path("a.txt"), dir.dir() + "/./a.txt"}, true},
        {"two outputs on standard output", {form}, {"-", "-"}, true},
        {"two outputs to /dev/null", {form}, {"/dev/null", "/dev/null"}, false},
        {"distinct outputs", {form}, {dir.path("a.txt"), dir.path("b.txt"), "-"}, false},
    };
    for (const auto& [name, inputs, outputs, refused] : cases) {
        bool usage = false;
        try {
            refuseClashingOutputs(inputs, outputs);
        } catch (const ToolError& error) {
            usage = error.failure() == Failure::Usage;
        }
        EXPECT_EQ(usage, refused) << name;
    }
}

TEST(OutputFile, ChartsWithNonFiniteOrMissingDataNeverReplaceTheTarget)
{
    const std::string head = "IT8\r\nBEGIN_DATA_FORMAT\nSample_Name\tCMYK_C\tCMYK_M\tCMYK_Y\tCMYK_K\tXYZ_X\t\n"
                             "END_DATA_FORMAT\nBEGIN_DATA\n1\t100\t0\t0\t0\t35.53\n";
    const std::tuple<std::string, Failure, const char*> cases[] = {
        {head + "2\t0\t100\t0\t0\t-nan\nEND_DATA\n", Failure::Calculation,
         "c.txt: nothing written: the calculation gave -nan for XYZ_X of patch 2 (C 0 M 100 Y 0 K 0)"},
        {head + "2\t0\t100\t0\t0\t1e999\nEND_DATA\n", Failure::Calculation, "gave 1e999 for XYZ_X of patch 2"},
        {head, Failure::OutputUnwritable, "c.txt: the chart was not written completely"},
    };
    for (const auto& [text, failure, message] : cases) {
        SCOPED_TRACE(message);
        ts::TempDir dir;
        std::ofstream(dir.path("c.txt")) << "old chart\n";
        try {
            PendingOutput output(dir.path("c.txt"));
            std::ofstream(output.temporaryPath()) << text;
            output.checkChart();
            ADD_FAILURE() << "accepted";
        } catch (const ToolError& error) {
            EXPECT_EQ(error.failure(), failure);
            EXPECT_NE(std::string(error.what()).find(message), std::string::npos) << error.what();
        }
        EXPECT_EQ(ts::readFile(dir.path("c.txt")), "old chart\n");
        EXPECT_EQ(entries(dir.dir()), 1);
    }
}

TEST(OutputFile, ToolWritesStandardOutputAndRemovesItsTemporaryFileWhenStopped)
{
    ts::TempDir dir;
    fs::create_directory(dir.path("tmp"));
    int status = 0;
    waitpid(startTool({"chart", kForm, "-o", dir.path("file.txt")}, dir.dir(), "/dev/null"), &status, 0);
    waitpid(startTool({"chart", kForm, "-o", "-"}, dir.dir(), dir.path("out.txt")), &status, 0);
    EXPECT_EQ(ts::readFile(dir.path("out.txt")), ts::readFile(dir.path("file.txt"))) << "the chart alone";
    mkfifo(dir.path("fifo").c_str(), 0600);
    for (const int signal : {SIGTERM, SIGINT, SIGHUP}) {
        SCOPED_TRACE(strsignal(signal));
        // The chart waits in its temporary file for a reader of the FIFO that never comes.
        const pid_t pid = startTool({"chart", kForm, "-o", dir.path("fifo")}, dir.dir(), "/dev/null");
        for (int wait = 0; wait < 500 && entries(dir.path("tmp")) == 0; ++wait)
            std::this_thread::sleep_for(std::chrono::milliseconds(10));
        EXPECT_EQ(entries(dir.path("tmp")), 1) << "the temporary file did not appear";
        kill(pid, signal);
        waitpid(pid, &status, 0);
        EXPECT_EQ(WIFSIGNALED(status) ? WTERMSIG(status) : -1, signal) << "status " << status;
        EXPECT_EQ(entries(dir.path("tmp")), 0) << "a temporary file was left";
    }
}
