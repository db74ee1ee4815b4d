// Outputs: where each kind of target is delivered, what is refused, and that nothing is left behind.
#include "TestSupport.h"
#include "OutputFile.h"
#include "Failure.h"

#include <gtest/gtest.h>

#include <sys/stat.h>
#include <unistd.h>

#include <cstdio>
#include <filesystem>
#include <fstream>
#include <future>

using namespace veltmarquist;
namespace ts = testsupport;
namespace fs = std::filesystem;

namespace {

long entries(const std::string& dir) { return std::distance(fs::directory_iterator(dir), fs::directory_iterator()); }

} // namespace

TEST(OutputFile, EachKindOfTargetIsDeliveredLikeUnixToolsDo)
{
    ts::TempDir dir;
    fs::create_directory(dir.path("tmp"));
    setenv("TMPDIR", dir.path("tmp").c_str(), 1);
    std::ofstream(dir.path("target.txt")) << "old\n";
    fs::create_symlink("target.txt", dir.path("link.txt"));
    std::ofstream(dir.path("kept.txt")) << "old\n";
    fs::permissions(dir.path("kept.txt"), fs::perms(0640));
    mkfifo(dir.path("fifo").c_str(), 0600);
    const std::string longName = dir.path(std::string(250, 'n') + ".txt");
    const std::tuple<const char*, std::string, std::string> cases[] = {
        {"symlink written through", dir.path("link.txt"), dir.path("target.txt")},
        {"mode kept", dir.path("kept.txt"), dir.path("kept.txt")},
        {"FIFO written, not replaced", dir.path("fifo"), dir.path("fifo")},
        {"name at the file system's limit", longName, longName},
    };
    for (const auto& [name, output, written] : cases) {
        SCOPED_TRACE(name);
        // A FIFO's reader must be there while it is written.
        std::future<std::string> fromFifo = std::async(std::launch::async, [path = written] {
            return fs::is_fifo(path) ? ts::readFile(path) : std::string();
        });
        PendingOutput pending(output);
        pending.write("new\n");
        pending.commit();
        EXPECT_EQ(fs::is_fifo(written) ? fromFifo.get() : ts::readFile(written), "new\n");
    }
    unsetenv("TMPDIR");
    EXPECT_TRUE(fs::is_symlink(dir.path("link.txt")));
    EXPECT_EQ(fs::status(dir.path("kept.txt")).permissions(), fs::perms(0640));
    EXPECT_TRUE(fs::is_fifo(dir.path("fifo")));
    EXPECT_EQ(entries(dir.dir()), 6) << "a temporary file was left";
    EXPECT_EQ(entries(dir.path("tmp")), 0) << "a temporary file was left";
}

TEST(OutputFile, ClashingOutputsAreRefusedBeforeAnythingIsWritten)
{
    ts::TempDir dir;
    const std::string form = dir.path("form.txt");
    std::ofstream(form) << "measurements\n";
    fs::create_symlink("form.txt", dir.path("link.txt"));
    fs::create_hard_link(form, dir.path("hard.txt"));
    fs::create_symlink("missing/chart.txt", dir.path("dangling.txt"));
    const std::tuple<const char*, std::vector<std::string>, bool> cases[] = {
        {"a folder", {dir.dir()}, true},
        {"a dangling symbolic link", {dir.path("dangling.txt")}, true},
        {"output through a symlink to the input", {dir.path("link.txt")}, true},
        {"output a hard link of the input", {dir.path("hard.txt")}, true},
        {"two new outputs on one path", {dir.path("a.txt"), dir.dir() + "/./a.txt"}, true},
        {"two outputs on standard output", {"-", "-"}, true},
        {"two outputs to /dev/null", {"/dev/null", "/dev/null"}, false},
        {"distinct outputs", {dir.path("a.txt"), dir.path("b.txt"), "-"}, false},
    };
    for (const auto& [name, outputs, refused] : cases) {
        Failure failure = Failure::Internal;
        try {
            refuseClashingOutputs({form}, outputs);
        } catch (const HostError& error) {
            failure = error.failure();
        }
        EXPECT_EQ(failure, refused ? Failure::Usage : Failure::Internal) << name;
    }
    for (const std::string& output : {std::string(), dir.dir(), dir.path("dangling.txt")})
        EXPECT_THROW(PendingOutput{output}, HostError) << "'" << output << "'";
    EXPECT_FALSE(fs::exists(dir.path("missing"))) << "written through a dangling link";
}

TEST(OutputFile, ChartsWithNonFiniteOrMissingDataNeverReplaceTheTarget)
{
    const std::string head = "IT8\r\nBEGIN_DATA_FORMAT\nSample_Name\tCMYK_C\tCMYK_M\tCMYK_Y\tCMYK_K\tXYZ_X\t\n"
                             "END_DATA_FORMAT\nBEGIN_DATA\n1\t100\t0\t0\t0\t1e-999\n";
    const std::pair<std::string, const char*> cases[] = {
        {head + "2\t0\t100\t0\t0\t-nan\nEND_DATA\n",
         "c.txt: nothing written: the calculation gave -nan for XYZ_X of patch 2 (C 0 M 100 Y 0 K 0)"},
        {head + "2\t0\t100\t0\t0\t1e999\nEND_DATA\n", "gave 1e999 for XYZ_X of patch 2"},
        {head, "c.txt: the chart was not written completely"},
    };
    for (const auto& [text, message] : cases) {
        SCOPED_TRACE(message);
        ts::TempDir dir;
        std::ofstream(dir.path("c.txt")) << "old chart\n";
        try {
            PendingOutput output(dir.path("c.txt"));
            std::ofstream(output.temporaryPath()) << text;
            output.checkChart();
            ADD_FAILURE() << "accepted";
        } catch (const HostError& error) {
            EXPECT_NE(std::string(error.what()).find(message), std::string::npos) << error.what();
        }
        EXPECT_EQ(ts::readFile(dir.path("c.txt")), "old chart\n");
        EXPECT_EQ(entries(dir.dir()), 1);
    }
}

TEST(OutputFile, AStreamThatFailsHalfwayLeavesTheTargetAsItWas)
{
    // An export streams its rows; a value it refuses part of the way through
    // throws with half a chart in the temporary file, which must vanish.
    ts::TempDir dir;
    std::ofstream(dir.path("c.txt")) << "old chart\n";
    try {
        PendingOutput output(dir.path("c.txt"));
        output.writeStreamed([](std::ostream& out) {
            out << "CTI3\nBEGIN_DATA\n";
            for (int row = 0; row < 1000; ++row)
                out << row << "\t0.5\n";
            throw HostError(Failure::Calculation, "the model predicted a value that is not a number for patch 1001");
        });
        output.commit();
        ADD_FAILURE() << "committed";
    } catch (const HostError& error) {
        EXPECT_EQ(error.failure(), Failure::Calculation);
    }
    EXPECT_EQ(ts::readFile(dir.path("c.txt")), "old chart\n");
    EXPECT_EQ(entries(dir.dir()), 1) << "no temporary file left";
    // A stream that completes is delivered whole.
    PendingOutput output(dir.path("c.txt"));
    output.writeStreamed([](std::ostream& out) { out << "new chart\n"; });
    output.commit();
    EXPECT_EQ(ts::readFile(dir.path("c.txt")), "new chart\n");
}
