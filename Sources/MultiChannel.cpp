// Six- and seven-colour processes: the seven-ink print model, its patch sets,
// and the chart writer with its two-call exchange.
//
// Tone ramps: for ink c and tone i (0..100 %), with a = (100 - i) / 100 and
// b = i / 100, each band interpolates paper W and solid S in the cube-root
// domain:   T(i) = (W^(1/3) a + S^(1/3) b)^3.
//
// Prediction: the gravure form widened to seven inks in channel order,
//     R = T0 (T1/W)^E1 (T2/W)^E2 ... (T6/W)^E6,
//     f(v) = (100 - v) q / 100 + 0.85 with q = 1 - 0.85,
//     E1 = f(cov0), E(n+1) = f(cov n) E(n);
// the separated set uses the fixed exponent 0.95 for every ink instead.
#include "ChartFile.h"
#include "MathProfile.h"

#include <cmath>
#include <cstdint>
#include <cstring>
#include <set>
#include <stdexcept>

namespace {

template <size_t Columns>
using Row = std::array<unsigned char, Columns>;

template <size_t Columns>
Row<Columns> rowWith(std::initializer_list<std::pair<int, int>> columnValues)
{
    Row<Columns> row{};
    for (const auto& cv : columnValues)
        row[static_cast<size_t>(cv.first)] = static_cast<unsigned char>(cv.second);
    return row;
}

// The rows of the six- and seven-colour charts. Each table is built by the
// same rules: single-ink ramps 100..0, crossfades of the three chromatic inks,
// black solid, all pairs at 100, all triples at 50, then ten black rows that
// the charts do not print.
template <size_t Columns, size_t Rows>
std::array<Row<Columns>, Rows> buildChannelChart(std::initializer_list<int> rampColumns, bool fourColourMidGrey)
{
    std::vector<Row<Columns>> rows;
    for (int column : rampColumns)
        for (int level = 100; level >= 0; level -= 10)
            rows.push_back(rowWith<Columns>({{column, level}}));
    const int crossfades[3][2] = {{0, 1}, {1, 2}, {2, 0}};
    for (const auto& pair : crossfades) {
        for (int k = 0; k <= 10; ++k)
            rows.push_back(rowWith<Columns>({{pair[0], 10 * k}, {pair[1], 100 - 10 * k}}));
        rows.push_back(rowWith<Columns>({{pair[0], 100}, {pair[1], 100}}));
    }
    rows.push_back(rowWith<Columns>({{3, 100}}));
    const int n = static_cast<int>(Columns);
    for (int i = 0; i < n; ++i)
        for (int j = i + 1; j < n; ++j)
            rows.push_back(rowWith<Columns>({{i, 100}, {j, 100}}));
    for (int i = 0; i < n; ++i)
        for (int j = i + 1; j < n; ++j)
            for (int k = j + 1; k < n; ++k)
                rows.push_back(rowWith<Columns>({{i, 50}, {j, 50}, {k, 50}}));
    if (fourColourMidGrey)
        rows.push_back(rowWith<Columns>({{0, 50}, {1, 50}, {2, 50}, {3, 50}}));
    for (int level = 90; level >= 0; level -= 10)
        rows.push_back(rowWith<Columns>({{3, level}}));

    std::array<Row<Columns>, Rows> table{};
    if (rows.size() != Rows)
        throw std::logic_error("multi-channel chart table has the wrong number of rows");
    std::copy(rows.begin(), rows.end(), table.begin());
    return table;
}

// The extended C, M, Y, K set: the union of grids and ramps below, each
// combination once, in ascending (C, M, Y, K) order; 3499 rows, then one
// unused all-zero row.
std::array<Row<4>, 3500> buildExtendedSet()
{
    std::set<Row<4>> combinations;
    auto add = [&](int c, int m, int y, int k) {
        combinations.insert(Row<4>{static_cast<unsigned char>(c), static_cast<unsigned char>(m),
                                   static_cast<unsigned char>(y), static_cast<unsigned char>(k)});
    };
    auto grid = [&](const std::vector<int>& blacks, const std::vector<int>& levels) {
        for (int k : blacks)
            for (int c : levels)
                for (int m : levels)
                    for (int y : levels)
                        add(c, m, y, k);
    };
    grid({0}, {0, 10, 20, 30, 40, 50, 60, 70, 80, 90, 100});                 // A
    grid({0}, {0, 10, 20, 30, 40, 55, 70, 85, 100});                         // B
    grid({10, 20, 30, 50, 70, 90}, {0, 10, 20, 40, 70, 100});                // C
    grid({40, 60}, {0, 20, 40, 70, 100});                                    // D
    grid({80}, {0, 40, 70, 100});                                            // E
    grid({100}, {0, 40, 100});                                               // F
    grid({0, 3, 40}, {0, 3, 40});                                            // G
    grid({0, 7}, {0, 7});                                                    // H
    for (int level : {0, 2, 3, 5, 7, 10, 15, 20, 25, 30, 40, 50, 60, 70, 75, 80, 85, 90, 95, 98, 100}) {
        add(level, 0, 0, 0);                                                 // I
        add(0, level, 0, 0);
        add(0, 0, level, 0);
        add(0, 0, 0, level);
    }
    // J: grey-balanced three-colour steps, with black from step 2 on.
    const int greySteps[7][3] = {{5, 3, 3}, {10, 6, 6}, {20, 12, 12}, {40, 27, 27},
                                 {60, 45, 45}, {80, 65, 65}, {100, 85, 85}};
    const struct {
        int k, first, last; // steps first..last (indices into greySteps)
    } blackRuns[] = {{0, 0, 6}, {10, 1, 3}, {20, 1, 4}, {40, 1, 5}, {60, 1, 6}, {80, 1, 6}, {100, 1, 6}};
    for (const auto& run : blackRuns)
        for (int s = run.first; s <= run.last; ++s)
            add(greySteps[s][0], greySteps[s][1], greySteps[s][2], run.k);

    std::array<Row<4>, 3500> table{};
    if (combinations.size() != 3499)
        throw std::logic_error("extended CMYK set must hold 3499 combinations");
    std::copy(combinations.begin(), combinations.end(), table.begin());
    return table; // row 3499 stays all zero
}

} // namespace

const std::array<std::array<unsigned char, 6>, 138> MathProfile::toBeCalculatedCLR6 =
    buildChannelChart<6, 138>({0, 1, 4, 2, 5}, true);
const std::array<std::array<unsigned char, 7>, 169> MathProfile::toBeCalculatedCLR7 =
    buildChannelChart<7, 169>({0, 6, 1, 4, 2, 5}, false);
const std::array<std::array<unsigned char, 4>, 3500> MathProfile::ZANExtended = buildExtendedSet();

void MathProfile::buildTintRamps()
{
    // Each band of every tone is (W^(1/3) a + S^(1/3) b)^3. The cube roots of
    // paper and solids do not depend on the tone, so they are taken once: the
    // same pow calls on the same operands, hence the same bits, 101 times fewer.
    // The general power function, not cbrt: a negative reflectance gives NaN
    // rather than a negative root.
    double paperRoot[kBands], solidRoot[kChannels][kBands];
    for (int j = 0; j < kBands; ++j) {
        paperRoot[j] = std::pow(patchSlots[kSlotPaper].spectrum[j], 1.0 / 3.0);
        for (int c = 0; c < kChannels; ++c)
            solidRoot[c][j] = std::pow(patchSlots[kSlotFirstTint + c].spectrum[j], 1.0 / 3.0);
    }
    ColorPatch& scratch = patchSlots[kSlotCurrentSample];
    for (int i = 0; i <= 100; ++i) {
        const double a = (100 - i) / 100.0;
        const double b = i / 100.0;
        for (int c = 0; c < kChannels; ++c) {
            for (int k = 0; k < kChannels; ++k)
                scratch.channel[k] = k == c ? i : 0.0;
            for (int j = 0; j < kBands; ++j)
                scratch.spectrum[j] = std::pow(paperRoot[j] * a + solidRoot[c][j] * b, 3.0);
            tintLists[c].push_back(scratch);
        }
    }
    for (auto& list : tintLists)
        sortData(list);
}

void MathProfile::calcMultiChannelSample()
{
    ColorPatch& sample = patchSlots[kSlotCurrentSample];
    const double q = 1.0 - 0.85;
    double E[kChannels] = {}; // E[n]: exponent of ink n (n = 1..6)
    double running = 1.0;
    for (int n = 1; n < kChannels; ++n) {
        const double f = (100.0 - sample.channel[n - 1]) * q / 100.0 + 0.85;
        running = n == 1 ? f : f * running;
        E[n] = running;
    }
    const double* W = patchSlots[kSlotPaper].spectrum;
    for (int j = 0; j < kBands; ++j) {
        double R = std::pow(patchSlots[kSlotFirstTint + 1].spectrum[j] / W[j], E[1]) *
                   patchSlots[kSlotFirstTint].spectrum[j];
        for (int n = 2; n < kChannels; ++n)
            R = R * std::pow(patchSlots[kSlotFirstTint + n].spectrum[j] / W[j], E[n]);
        sample.spectrum[j] = R;
    }
    spec2XYZ(&sample);
}

void MathProfile::calcSeparationSample()
{
    ColorPatch& sample = patchSlots[kSlotCurrentSample];
    const double* W = patchSlots[kSlotPaper].spectrum;
    for (int j = 0; j < kBands; ++j) {
        double R = std::pow(patchSlots[kSlotFirstTint + 1].spectrum[j] / W[j], 0.95) *
                   patchSlots[kSlotFirstTint].spectrum[j];
        for (int n = 2; n < kChannels; ++n)
            R = R * std::pow(patchSlots[kSlotFirstTint + n].spectrum[j] / W[j], 0.95);
        sample.spectrum[j] = R;
    }
    spec2XYZ(&sample);
}

namespace {

// Host coverage in thousandths of a percent to whole percent: (u + 900) / 1000
// in 32-bit arithmetic, truncated toward zero (99 -> 0, 100 -> 1, 50100 -> 51,
// -1900 -> -1). The sum wraps as a 32-bit register would instead of overflowing.
double hostCoverage(int u)
{
    const auto sum = static_cast<std::int32_t>(static_cast<std::uint32_t>(u) + 900u);
    return static_cast<double>(sum / 1000);
}

} // namespace

void MathProfile::calculateChartMCH(double** rows, PrintProcess process, const char* path, int* measurements)
{
    std::ofstream stream;
    chartfile::open(stream, path);
    ColorPatch& sample = patchSlots[kSlotCurrentSample];

    if (process == VM_PROCESS_SIX_COLOUR || process == VM_PROCESS_SEVEN_COLOUR) {
        const bool six = process == VM_PROCESS_SIX_COLOUR;
        ColorPatch& paper = patchSlots[kSlotPaper];
        std::memset(paper.channel, 0, sizeof paper.channel);
        for (int c = 0; c < kChannels; ++c)
            patchSlots[kSlotFirstTint + c] = paper;
        // Measured patches: C, M, Y, K solids 0..3, paper 4, further inks 8, 9
        // (and 10). The six-colour form has two further inks: ink B serves
        // channels 5 and 6, and channel 5 is never printed.
        const int solidRow[kChannels] = {0, 1, 2, 3, 8, 9, six ? 9 : 10};
        std::memcpy(paper.spectrum, rows[4], sizeof paper.spectrum);
        for (int c = 0; c < kChannels; ++c)
            std::memcpy(patchSlots[kSlotFirstTint + c].spectrum, rows[solidRow[c]], sizeof paper.spectrum);

        const int sets = six ? 128 : 159;
        stream << "IT8.7\r\nTARGET_ID\t\"" << (six ? "5.11" : "7.11") << "\"\r\nTARGET\r\nLAYOUT_ID\r\nNUMBER_OF_SETS\t"
               << sets << std::endl;
        stream << "NUMBER_OF_FIELDS\t" << 43 << std::endl;
        stream << "BEGIN_DATA_FORMAT" << std::endl;
        stream << "CMYK_C\tCMYK_M\tCMYK_Y\tCMYK_K\tRGB_R\tRGB_G\tRGB_B\t";
        for (int nm = 380; nm <= 730; nm += 10)
            stream << "SPECTRAL_" << nm << '\t';
        stream << std::endl;
        stream << "END_DATA_FORMAT" << std::endl;
        stream << "BEGIN_DATA" << std::endl;

        buildTintRamps();
        for (int r = 0; r < sets; ++r) {
            if (six) {
                const auto& row = toBeCalculatedCLR6[static_cast<size_t>(r)];
                setSample(row[0], row[1], row[2], row[3], row[4], 0.0, row[5]);
            } else {
                const auto& row = toBeCalculatedCLR7[static_cast<size_t>(r)];
                setSample(row[0], row[1], row[2], row[3], row[4], row[5], row[6]);
            }
            calcMultiChannelSample();
            for (double value : sample.channel)
                stream << value << '\t';
            for (double value : sample.spectrum)
                stream << value << '\t';
            stream << std::endl;
        }
        // Hand the extended C, M, Y, K set to the host; ints 7i+4..7i+6 stay.
        for (int i = 0; i < VM_EXCHANGE_RECORDS; ++i)
            for (int c = 0; c < 4; ++c)
                measurements[7 * i + c] = ZANExtended[static_cast<size_t>(i)][static_cast<size_t>(c)];
    } else if (process == VM_PROCESS_SEPARATED_SET) {
        chartfile::writeXYZHeader(stream, VM_EXCHANGE_RECORDS);
        for (int i = 0; i < VM_EXCHANGE_RECORDS; ++i) {
            const int* record = measurements + 7 * i;
            setSample(hostCoverage(record[0]), hostCoverage(record[1]), hostCoverage(record[2]),
                      hostCoverage(record[3]), hostCoverage(record[4]), hostCoverage(record[5]),
                      hostCoverage(record[6]));
            calcSeparationSample();
            chartfile::limitY(sample.XYZ);
            // Only to label the line with the combination the host separated;
            // the X, Y, Z predicted above stay in the sample.
            const auto& cmyk = ZANExtended[static_cast<size_t>(i)];
            setSample(cmyk[0], cmyk[1], cmyk[2], cmyk[3], 0.0, 0.0, 0.0);
            chartfile::writeXYZLine(stream, i + 1, sample.channel, sample.XYZ);
        }
    }
    chartfile::finish(stream);
}
