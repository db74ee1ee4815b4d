// Fuzzer of the tool's measurement-file reader: any bytes as file text, with
// the scale detected and fixed at percent. The reader never throws (that
// aborts); it returns one error naming a line of the text, or a file whose
// every set has one value per band and per device field, within the promised
// ranges.
#include "MeasurementFile.h"

#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <string>

namespace {

void check(bool kept, const char* promise, const std::string& where = std::string())
{
    if (!kept) {
        std::fprintf(stderr, "broken promise: %s %s\n", promise, where.c_str());
        std::abort();
    }
}

void read(const std::string& text, double scale)
{
    veltmarquist::ReadOptions options;
    options.scale = scale;
    const veltmarquist::ReadResult result = veltmarquist::readMeasurementText(text, options);
    if (!result.ok()) {
        long lines = 1; // ended by LF, CR LF or a lone CR
        for (std::size_t i = 0; i < text.size(); ++i)
            lines += text[i] == '\n' || (text[i] == '\r' && (i + 1 == text.size() || text[i + 1] != '\n'));
        check(!result.error.message.empty(), "an error says what is wrong");
        check(result.error.line >= 0 && result.error.line <= lines, "an error names a line of the file:",
              std::to_string(result.error.line));
        return;
    }
    const veltmarquist::MeasurementFile& file = *result.file;
    check(!file.sets.empty(), "a file holds at least one set");
    check(!file.layout.present() || file.layout.stepNm == 10 || file.layout.stepNm == 20,
          "bands are 10 or 20 nm apart");
    for (const auto& set : file.sets) {
        check(set.reflectance.size() == static_cast<std::size_t>(file.layout.bands), "one reflectance per band:",
              set.where());
        check(set.device.size() == file.deviceFields.size(), "one device value per device field:", set.where());
        for (double value : set.reflectance)
            check(value >= -0.5 && value <= 3.0, "reflectance within -0.5 to 3:", set.where());
        for (double value : set.device)
            check(value >= -0.05 && value <= 100.05, "device values within 0 to 100 %:", set.where());
    }
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    const std::string text(reinterpret_cast<const char*>(data), size);
    read(text, 0.0);
    read(text, 100.0);
    return 0;
}
