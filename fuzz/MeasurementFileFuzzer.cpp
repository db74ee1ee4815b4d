// Fuzzer of the tool's measurement-file reader: any bytes as file text, scale
// detected and fixed at percent. Never throws; gives one error naming a line
// of the text, or sets with one value per band and device field, in range.
#include "MeasurementFile.h"

#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <string>

#define PROMISE(kept) ((kept) || (std::fprintf(stderr, "broken promise: %s\n", #kept), std::abort(), false))

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    const std::string text(reinterpret_cast<const char*>(data), size);
    long lines = 1; // ended by LF, CR LF or a lone CR
    for (std::size_t i = 0; i < size; ++i)
        lines += text[i] == '\n' || (text[i] == '\r' && (i + 1 == size || text[i + 1] != '\n'));
    for (double scale : {0.0, 100.0}) {
        const auto result = veltmarquist::readMeasurementText(text, veltmarquist::ReadOptions{scale});
        if (!result.ok()) {
            PROMISE(!result.error.message.empty() && result.error.line >= 0 && result.error.line <= lines);
            continue;
        }
        const veltmarquist::MeasurementFile& f = *result.file;
        PROMISE(!f.sets.empty() && (!f.layout.present() || f.layout.stepNm == 10 || f.layout.stepNm == 20));
        for (const auto& set : f.sets) {
            PROMISE(set.reflectance.size() == size_t(f.layout.bands) && set.device.size() == f.deviceFields.size());
            for (double value : set.reflectance)
                PROMISE(value >= -0.5 && value <= 3.0);
            for (double value : set.device)
                PROMISE(value >= -0.05 && value <= 100.05);
        }
    }
    return 0;
}
