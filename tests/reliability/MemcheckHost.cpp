// A small host of the shared library for memcheck runs: every process on the
// golden inputs, compared byte for byte with the reference charts, and the
// calls that fail (statuses 1, 2 and 4), so that the clean-up of each path
// runs under the checker.
//
//   veltmarquist_memcheck_host <golden folder> <output folder>
//
// Exit code 0 when every call gave its expected status and chart.
#include "VeltmarquistDLL.h"

#include <cstdio>
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

namespace {

struct Block {
    int kind = 0, first = 0, perPatch = 0, count = 0;
    std::vector<int> ints;
};

std::string folder, out;
int failures = 0;

std::string slurp(const std::string& path)
{
    std::ifstream in(path, std::ios::binary);
    std::ostringstream text;
    text << in.rdbuf();
    return text.str();
}

Block golden(const std::string& name)
{
    std::istringstream in(slurp(folder + "/" + name));
    Block block;
    int n = 0;
    in >> block.kind >> block.first >> block.perPatch >> block.count >> n;
    block.ints.assign(static_cast<size_t>(n > VM_EXCHANGE_BUFFER_INTS ? n : VM_EXCHANGE_BUFFER_INTS), 0);
    for (int i = 0; i < n; ++i)
        in >> block.ints[static_cast<size_t>(i)];
    if (!in) {
        std::fprintf(stderr, "cannot read %s\n", name.c_str());
        ++failures;
    }
    return block;
}

void putSeparations(Block& block)
{
    std::istringstream in(slurp(folder + "/multichannel.separations"));
    for (int i = 0; i < VM_EXCHANGE_BUFFER_INTS; ++i)
        in >> block.ints[static_cast<size_t>(i)];
}

// One call; checks the status and, for a reference, the chart's bytes.
// Returns whether the profile is still alive (statuses 1 and 3 destroy it).
bool run(void* profile, int process, Block& block, int expected, const char* reference = nullptr,
         const std::string& path = std::string())
{
    const std::string chart = path.empty() ? out + "/chart.txt" : path;
    const int status = CalculateChart(profile, static_cast<PrintProcess>(process), chart.c_str(), block.ints.data(),
                                      block.kind, block.first, block.perPatch, block.count);
    if (status != expected) {
        std::fprintf(stderr, "process %d: status %d, expected %d\n", process, status, expected);
        ++failures;
    } else if (reference != nullptr && slurp(chart) != slurp(folder + "/" + reference)) {
        std::fprintf(stderr, "process %d: chart differs from %s\n", process, reference);
        ++failures;
    }
    if (path.empty())
        std::remove(chart.c_str());
    return status != VM_STATUS_FILE_NOT_OPENED && status != VM_STATUS_CALCULATION_FAILED;
}

// Runs the calls of one profile in order while it lives, then destroys it.
struct Session {
    void* profile = CreateMathProfile("memcheck");
    bool alive = profile != nullptr;
    void operator()(int process, Block& block, int expected, const char* reference = nullptr,
                    const std::string& path = std::string())
    {
        if (alive)
            alive = run(profile, process, block, expected, reference, path);
    }
    ~Session()
    {
        if (alive)
            DestroyMathProfile(profile);
    }
};

} // namespace

int main(int argc, char** argv)
{
    if (argc != 3) {
        std::fprintf(stderr, "usage: %s <golden folder> <output folder>\n", argv[0]);
        return 2;
    }
    folder = argv[1];
    out = argv[2];

    {
        Session call;
        Block form = golden("offset-form.in");
        call(VM_PROCESS_GRAVURE, form, VM_STATUS_OK, "offset-form.p1.chart");
    }
    {
        Session call;
        Block form16 = golden("offset-form-k20.in");
        call(VM_PROCESS_OFFSET, form16, VM_STATUS_OK, "offset-form-k20.p0.chart");
    }
    for (int process : {VM_PROCESS_SIX_COLOUR, VM_PROCESS_SEVEN_COLOUR}) {
        Session call;
        Block multi = golden("multichannel.in");
        const bool six = process == VM_PROCESS_SIX_COLOUR;
        call(VM_PROCESS_SEPARATED_SET, multi, VM_STATUS_INVALID_MEASUREMENTS); // no ramps yet
        call(process, multi, VM_STATUS_OK, six ? "multichannel.p3.chart" : "multichannel.p5.chart");
        putSeparations(multi);
        call(VM_PROCESS_SEPARATED_SET, multi, VM_STATUS_OK, six ? "multichannel.p3-p6.chart" : "multichannel.p5-p6.chart");
    }
    {
        Session call;
        Block conversion = golden("conversion.in");
        call(VM_PROCESS_CHART_COPY, conversion, VM_STATUS_OK, "conversion.p7.chart");
        call(VM_PROCESS_CHART_CONVERT, conversion, VM_STATUS_OK, "conversion.p8.chart");
        call(VM_PROCESS_CHART_BLEND, conversion, VM_STATUS_OK, "conversion.p9.chart");
        conversion.kind = 15;
        call(VM_PROCESS_CHART_COPY, conversion, VM_STATUS_UNKNOWN_INPUT_KIND);
        conversion.kind = VM_INPUT_10NM;
        conversion.count = 1;
        call(VM_PROCESS_CHART_COPY, conversion, VM_STATUS_INVALID_MEASUREMENTS);
        conversion.count = 32;
        // Status 1 destroys the profile; the checker sees whether it was freed.
        call(VM_PROCESS_CHART_BLEND, conversion, VM_STATUS_FILE_NOT_OPENED, nullptr, out + "/missing-folder/chart.txt");
    }
    {
        Session call;
        Block multi = golden("multichannel.in");
        call(VM_PROCESS_SIX_COLOUR, multi, VM_STATUS_FILE_NOT_OPENED, nullptr, out); // a folder
    }

    if (failures == 0)
        std::printf("memcheck host: every call as expected\n");
    return failures == 0 ? 0 : 1;
}
