// Fuzzer of the measurement-file reader: any bytes as file text, scale
// detected and fixed at percent. Never throws; gives one short error naming a
// line of the text, or sets with one value per band and device field, in
// range. A table that reads and can be written reads back the same.
#include "Cgats.h"
#include "MeasurementFile.h"

#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <stdexcept>
#include <string>

#define PROMISE(kept) ((kept) || (std::fprintf(stderr, "broken promise: %s\n", #kept), std::abort(), false))

using namespace veltmarquist;

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    const std::string text(reinterpret_cast<const char*>(data), size);
    long lines = 1; // ended by LF, CR LF or a lone CR
    for (std::size_t i = 0; i < size; ++i)
        lines += text[i] == '\n' || (text[i] == '\r' && (i + 1 == size || text[i + 1] != '\n'));
    for (double scale : {0.0, 100.0}) {
        const ReadResult result = readMeasurementText(text, ReadOptions{scale});
        if (!result.ok()) {
            const ReadError& error = result.error;
            PROMISE(!error.message.empty() && error.message.size() < 400 && error.line >= 0 && error.line <= lines);
            continue;
        }
        const MeasurementFile& f = *result.file;
        PROMISE(!f.sets.empty() && (!f.layout.present() || f.layout.stepNm == 10 || f.layout.sixteenBand()));
        for (const std::string& warning : f.warnings)
            PROMISE(warning.size() < 400);
        for (const MeasurementSet& set : f.sets) {
            PROMISE(set.reflectance.size() == size_t(f.layout.bands) && set.device.size() == f.deviceFields.size());
            for (std::int32_t value : set.reflectance)
                PROMISE(value >= -kReflectanceUnits / 2 && value <= 3 * kReflectanceUnits);
            for (std::int32_t value : set.device)
                PROMISE(value >= -kDeviceUnits / 20 && value <= 100 * kDeviceUnits + kDeviceUnits / 20);
        }
    }
    // Write what was read, read it back: the same fields and cells.
    const auto [table, error] = cgats::readTable(text);
    if (error)
        return 0;
    cgats::Document document{table.header.sheetType.empty() ? "CGATS.17" : table.header.sheetType, {},
                             table.header.fields, table.rows};
    std::string written;
    try {
        written = cgats::write(document);
    } catch (const std::invalid_argument&) {
        return 0; // a quote or field name CGATS cannot write back
    }
    const auto [again, againError] = cgats::readTable(written);
    PROMISE(!againError && again.header.fields == table.header.fields && again.rows == table.rows);
    return 0;
}
