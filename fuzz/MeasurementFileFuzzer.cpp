// Fuzzer of the tool's measurement-file reader: any bytes as file text. The
// reader must return either a file or one error, never throw, and a file it
// returns must be consistent: every set has one value per device field and
// per band, within the ranges the reader promises.
#include "MeasurementFile.h"

#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <string>

namespace {

[[noreturn]] void broken(const char* promise, const std::string& detail = std::string())
{
    std::fprintf(stderr, "broken promise: %s %s\n", promise, detail.c_str());
    std::abort();
}

int linesOf(const std::string& text)
{
    int lines = 1;
    for (std::size_t i = 0; i < text.size(); ++i)
        if (text[i] == '\n' || (text[i] == '\r' && (i + 1 == text.size() || text[i + 1] != '\n')))
            ++lines;
    return lines;
}

void check(const std::string& text, const veltmarquist::ReadOptions& options)
{
    veltmarquist::ReadResult result;
    try {
        result = veltmarquist::readMeasurementText(text, options);
    } catch (const std::exception& error) {
        broken("the reader never throws:", error.what());
    } catch (...) {
        broken("the reader never throws");
    }
    if (!result.ok()) {
        if (result.error.message.empty())
            broken("an error says what is wrong");
        if (result.error.line < 0 || result.error.line > linesOf(text))
            broken("an error names a line of the file:", std::to_string(result.error.line));
        return;
    }
    const veltmarquist::MeasurementFile& file = *result.file;
    if (file.sets.empty())
        broken("a file holds at least one set");
    if (file.layout.present() && file.layout.stepNm != 10 && file.layout.stepNm != 20)
        broken("bands are 10 or 20 nm apart:", std::to_string(file.layout.stepNm));
    for (const auto& set : file.sets) {
        if (set.reflectance.size() != static_cast<std::size_t>(file.layout.bands))
            broken("one reflectance per band:", set.where());
        if (set.device.size() != file.deviceFields.size())
            broken("one device value per device field:", set.where());
        for (double value : set.reflectance)
            if (!(value >= -0.5 && value <= 3.0))
                broken("reflectance within -0.5 to 3:", set.where());
        for (double value : set.device)
            if (!(value >= -0.05 && value <= 100.05))
                broken("device values within 0 to 100 %:", set.where());
    }
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    const std::string text(reinterpret_cast<const char*>(data), size);
    check(text, veltmarquist::ReadOptions{});
    veltmarquist::ReadOptions percent;
    percent.scale = 100.0;
    check(text, percent);
    return 0;
}
