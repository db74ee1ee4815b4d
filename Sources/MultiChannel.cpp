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
#include <stdexcept>

namespace {

template <size_t Columns>
using Row = std::array<unsigned char, Columns>;

// Rows collected at compile time, in the order they are added.
template <size_t Columns, size_t Capacity>
struct RowList {
    std::array<Row<Columns>, Capacity> rows{};
    size_t size = 0;

    constexpr void add(std::initializer_list<std::pair<int, int>> columnValues)
    {
        Row<Columns> row{};
        for (const auto& cv : columnValues)
            row[static_cast<size_t>(cv.first)] = static_cast<unsigned char>(cv.second);
        rows[size++] = row;
    }
};

// The rows of the six- and seven-colour charts. Each table is built by the
// same rules: single-ink ramps 100..0, crossfades of the three chromatic inks,
// black solid, all pairs at 100, all triples at 50, then ten black rows that
// the charts do not print.
template <size_t Columns, size_t Rows, size_t Ramps>
constexpr RowList<Columns, Rows + 1> channelChart(const int (&rampColumns)[Ramps], bool fourColourMidGrey)
{
    RowList<Columns, Rows + 1> list; // one row to spare, so that a rule adding one too many fails the assertion
    for (int column : rampColumns)
        for (int level = 100; level >= 0; level -= 10)
            list.add({{column, level}});
    const int crossfades[3][2] = {{0, 1}, {1, 2}, {2, 0}};
    for (const auto& pair : crossfades) {
        for (int k = 0; k <= 10; ++k)
            list.add({{pair[0], 10 * k}, {pair[1], 100 - 10 * k}});
        list.add({{pair[0], 100}, {pair[1], 100}});
    }
    list.add({{3, 100}});
    const int n = static_cast<int>(Columns);
    for (int i = 0; i < n; ++i)
        for (int j = i + 1; j < n; ++j)
            list.add({{i, 100}, {j, 100}});
    for (int i = 0; i < n; ++i)
        for (int j = i + 1; j < n; ++j)
            for (int k = j + 1; k < n; ++k)
                list.add({{i, 50}, {j, 50}, {k, 50}});
    if (fourColourMidGrey)
        list.add({{0, 50}, {1, 50}, {2, 50}, {3, 50}});
    for (int level = 90; level >= 0; level -= 10)
        list.add({{3, level}});
    return list;
}

template <size_t Columns, size_t Rows, size_t Capacity>
constexpr std::array<Row<Columns>, Rows> firstRows(const RowList<Columns, Capacity>& list)
{
    std::array<Row<Columns>, Rows> table{};
    for (size_t i = 0; i < Rows; ++i)
        table[i] = list.rows[i];
    return table;
}

constexpr int kSixRamps[] = {0, 1, 4, 2, 5}, kSevenRamps[] = {0, 6, 1, 4, 2, 5};
constexpr auto kSixColourRows = channelChart<6, 138>(kSixRamps, true);
constexpr auto kSevenColourRows = channelChart<7, 169>(kSevenRamps, false);
static_assert(kSixColourRows.size == 138 && kSevenColourRows.size == 169, "the multi-channel charts' rows");

// The extended C, M, Y, K set: the union of grids and ramps below, each
// combination once, in ascending (C, M, Y, K) order; 3499 rows, then one
// unused all-zero row. Built at compile time: every combination added as the
// key C M Y K (one byte each, C highest), the keys sorted, repeats dropped.
constexpr size_t kExtendedAdds = 3915; // A 1331, B 729, C 1296, D 250, E 64, F 27, G 81, H 16, I 84, J 37

struct ExtendedKeys {
    std::array<std::uint32_t, kExtendedAdds> keys{};
    size_t size = 0;

    constexpr void add(int c, int m, int y, int k)
    {
        keys[size++] = static_cast<std::uint32_t>(c) << 24 | static_cast<std::uint32_t>(m) << 16 |
                       static_cast<std::uint32_t>(y) << 8 | static_cast<std::uint32_t>(k);
    }
    template <size_t Blacks, size_t Levels>
    constexpr void grid(const int (&blacks)[Blacks], const int (&levels)[Levels])
    {
        for (int k : blacks)
            for (int c : levels)
                for (int m : levels)
                    for (int y : levels)
                        add(c, m, y, k);
    }
};

constexpr ExtendedKeys extendedKeys()
{
    ExtendedKeys set;
    set.grid({0}, {0, 10, 20, 30, 40, 50, 60, 70, 80, 90, 100});  // A
    set.grid({0}, {0, 10, 20, 30, 40, 55, 70, 85, 100});          // B
    set.grid({10, 20, 30, 50, 70, 90}, {0, 10, 20, 40, 70, 100}); // C
    set.grid({40, 60}, {0, 20, 40, 70, 100});                     // D
    set.grid({80}, {0, 40, 70, 100});                             // E
    set.grid({100}, {0, 40, 100});                                // F
    set.grid({0, 3, 40}, {0, 3, 40});                             // G
    set.grid({0, 7}, {0, 7});                                     // H
    for (int level : {0, 2, 3, 5, 7, 10, 15, 20, 25, 30, 40, 50, 60, 70, 75, 80, 85, 90, 95, 98, 100}) {
        set.add(level, 0, 0, 0); // I
        set.add(0, level, 0, 0);
        set.add(0, 0, level, 0);
        set.add(0, 0, 0, level);
    }
    // J: grey-balanced three-colour steps, with black from step 2 on.
    const int greySteps[7][3] = {{5, 3, 3}, {10, 6, 6}, {20, 12, 12}, {40, 27, 27},
                                 {60, 45, 45}, {80, 65, 65}, {100, 85, 85}};
    const int blackRuns[7][3] = {{0, 0, 6}, {10, 1, 3}, {20, 1, 4}, {40, 1, 5}, {60, 1, 6}, {80, 1, 6}, {100, 1, 6}};
    for (const auto& run : blackRuns) // black, steps first..last (indices into greySteps)
        for (int s = run[1]; s <= run[2]; ++s)
            set.add(greySteps[s][0], greySteps[s][1], greySteps[s][2], run[0]);
    // Sorted byte by byte from the lowest (a radix sort: few enough steps
    // for every compiler's constant evaluation), then each key once.
    std::array<std::uint32_t, kExtendedAdds> sorted{};
    for (int shift = 0; shift < 32; shift += 8) {
        size_t start[257] = {};
        for (size_t i = 0; i < set.size; ++i)
            ++start[(set.keys[i] >> shift & 0xFF) + 1];
        for (size_t digit = 0; digit < 256; ++digit)
            start[digit + 1] += start[digit];
        for (size_t i = 0; i < set.size; ++i)
            sorted[start[set.keys[i] >> shift & 0xFF]++] = set.keys[i];
        set.keys = sorted;
    }
    size_t unique = 0;
    for (size_t i = 0; i < set.size; ++i)
        if (unique == 0 || set.keys[unique - 1] != set.keys[i])
            set.keys[unique++] = set.keys[i];
    set.size = unique;
    return set;
}

constexpr ExtendedKeys kExtendedKeys = extendedKeys();
static_assert(kExtendedKeys.size == 3499, "the extended C, M, Y, K set holds 3499 combinations");

constexpr std::array<Row<4>, 3500> extendedSet()
{
    std::array<Row<4>, 3500> table{};
    for (size_t i = 0; i < kExtendedKeys.size; ++i)
        for (size_t c = 0; c < 4; ++c)
            table[i][c] = static_cast<unsigned char>(kExtendedKeys.keys[i] >> (24 - 8 * c));
    return table; // row 3499 stays all zero
}

} // namespace

// Constant-initialised: nothing of these tables is built when the library loads.
const std::array<std::array<unsigned char, 6>, 138> MathProfile::toBeCalculatedCLR6 =
    firstRows<6, 138>(kSixColourRows);
const std::array<std::array<unsigned char, 7>, 169> MathProfile::toBeCalculatedCLR7 =
    firstRows<7, 169>(kSevenColourRows);
const std::array<std::array<unsigned char, 4>, 3500> MathProfile::ZANExtended = extendedSet();

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
    chartfile::ChartStream stream(path);
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
               << sets << chartfile::endl;
        stream << "NUMBER_OF_FIELDS\t" << 43 << chartfile::endl;
        stream << "BEGIN_DATA_FORMAT" << chartfile::endl;
        stream << "CMYK_C\tCMYK_M\tCMYK_Y\tCMYK_K\tRGB_R\tRGB_G\tRGB_B\t";
        for (int nm = 380; nm <= 730; nm += 10)
            stream << "SPECTRAL_" << nm << '\t';
        stream << chartfile::endl;
        stream << "END_DATA_FORMAT" << chartfile::endl;
        stream << "BEGIN_DATA" << chartfile::endl;

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
            stream << chartfile::endl;
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
    stream.finish();
}
