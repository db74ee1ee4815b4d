// Writes the seed corpus of the CalculateChart fuzzer from the golden inputs:
// each reference call as the fuzzer encodes it, the multi-channel exchange,
// and a few hostile variants.
//
//   make_chart_seeds <golden folder> <output folder>
#include "ChartCallInput.h"

#include <cstdio>
#include <fstream>
#include <sstream>
#include <string>

using chartfuzz::Call;

namespace {

struct Golden {
    Call call;
    std::vector<std::int32_t> ints;
};

Golden readGolden(const std::string& folder, const std::string& name)
{
    std::ifstream in(folder + "/" + name);
    Golden golden;
    int n = 0;
    in >> golden.call.inputKind >> golden.call.firstWavelength >> golden.call.valuesPerPatch >> golden.call.count >> n;
    golden.ints.resize(static_cast<size_t>(n > 0 ? n : 0));
    for (auto& value : golden.ints)
        in >> value;
    if (!in) {
        std::fprintf(stderr, "cannot read %s/%s\n", folder.c_str(), name.c_str());
        std::exit(1);
    }
    return golden;
}

Call with(Call call, int process, std::uint8_t flags = 0, int failing = 0, int scale = 1)
{
    call.process = process;
    call.flags = flags;
    call.failingAllocation = failing;
    call.scale = scale;
    return call;
}

} // namespace

int main(int argc, char** argv)
{
    if (argc != 3) {
        std::fprintf(stderr, "usage: %s <golden folder> <output folder>\n", argv[0]);
        return 2;
    }
    const std::string golden = argv[1], out = argv[2];
    int written = 0;
    auto seed = [&](const std::string& name, const std::vector<Call>& calls, const std::vector<std::int32_t>& pool) {
        const auto bytes = chartfuzz::encode(calls, pool);
        std::ofstream file(out + "/" + name, std::ios::binary);
        file.write(reinterpret_cast<const char*>(bytes.data()), static_cast<std::streamsize>(bytes.size()));
        if (!file) {
            std::fprintf(stderr, "cannot write %s/%s\n", out.c_str(), name.c_str());
            std::exit(1);
        }
        ++written;
    };

    const Golden form = readGolden(golden, "offset-form.in");
    const Golden form16 = readGolden(golden, "offset-form-k20.in");
    const Golden multi = readGolden(golden, "multichannel.in");
    const Golden conversion = readGolden(golden, "conversion.in");
    using namespace chartfuzz;

    seed("gravure", {with(form.call, 1)}, form.ints);
    seed("gravure-16-band", {with(form16.call, 1)}, form16.ints);
    seed("offset-failing-row", {with(form.call, 0, kFailAllocation, 5)}, form.ints);
    seed("offset-16-band", {with(form16.call, 0)}, form16.ints);
    seed("six-colour-then-separated", {with(multi.call, 3), with(multi.call, 6, 0, 0, 100)}, multi.ints);
    seed("seven-colour-then-separated", {with(multi.call, 5), with(multi.call, 6, 0, 0, 100)}, multi.ints);
    seed("separated-without-ramps", {with(multi.call, 6)}, multi.ints);
    seed("separated-16-band-without-ramps", {with(form16.call, 6)}, form16.ints);
    seed("six-colour-16-band-then-separated", {with(form16.call, 3), with(form16.call, 6, 0, 0, 100)}, form16.ints);
    seed("copy", {with(conversion.call, 7)}, conversion.ints);
    seed("convert", {with(conversion.call, 8)}, conversion.ints);
    seed("blend-then-copy", {with(conversion.call, 9), with(conversion.call, 7)}, conversion.ints);

    Call sixteenConversion = with(form16.call, 7);
    sixteenConversion.count = 3;
    seed("copy-16-band", {sixteenConversion}, form16.ints);

    Call unknownKind = with(conversion.call, 7);
    unknownKind.inputKind = 15;
    seed("unknown-kind", {unknownKind, with(conversion.call, 7)}, conversion.ints);
    seed("null-path", {with(conversion.call, 8, kNullPath), with(conversion.call, 8)}, conversion.ints);
    seed("missing-folder", {with(conversion.call, 9, kMissingFolder << 3)}, conversion.ints);
    seed("folder-as-path", {with(multi.call, 3, kFolder << 3)}, multi.ints);
    seed("failing-last-buffer", {with(conversion.call, 7, kFailAllocation, conversion.call.count + 2)},
         conversion.ints);
    Call short3 = with(multi.call, 3);
    short3.count = 9;
    seed("six-colour-too-short", {short3, with(multi.call, 6)}, multi.ints);
    Call shifted = with(conversion.call, 8);
    shifted.firstWavelength = 360;
    shifted.valuesPerPatch = 40;
    seed("from-360-nm", {shifted}, conversion.ints);

    std::printf("%d seeds in %s\n", written, out.c_str());
    return 0;
}
