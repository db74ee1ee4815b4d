// Measurement intake: the 46 measured patches of the four-colour test form go
// into the profile's fixed slots (paper, overprints, greys) and tint lists
// (single-ink tints), and the lists are ordered by coverage.
//
// The channel values of a stored patch always come from the form's layout
// (`dithering`), never from the measurement; the measurement gives the spectrum.
#include "Colorimetry.h"
#include "FormOrientation.h"
#include "MathProfile.h"
#include "ProfileSteps.h"

#include <cstring>

// The test form in measuring order: C, M, Y, K coverage in percent. Where each
// patch goes follows from its coverages alone (see classify below).
const unsigned char MathProfile::dithering[46][4] = {
    //  C    M    Y    K         patch  goes to
    {100, 0, 0, 0},         //  0  cyan list
    {0, 0, 0, 0},           //  1  slot 13 paper
    {100, 100, 0, 100},     //  2  slot 8
    {0, 0, 40, 0},          //  3  yellow list
    {0, 0, 0, 80},          //  4  black list
    {10, 0, 0, 0},          //  5  cyan list
    {0, 100, 100, 0},       //  6  slot 0 red
    {0, 0, 20, 0},          //  7  yellow list
    {100, 0, 100, 0},       //  8  slot 1 green
    {0, 0, 10, 0},          //  9  yellow list
    {90, 0, 0, 0},          // 10  cyan list
    {0, 0, 80, 0},          // 11  yellow list
    {100, 100, 100, 0},     // 12  slot 9
    {0, 10, 0, 0},          // 13  magenta list
    {0, 100, 0, 0},         // 14  magenta list
    {0, 0, 90, 0},          // 15  yellow list
    {0, 0, 0, 40},          // 16  black list
    {0, 90, 0, 0},          // 17  magenta list
    {100, 100, 100, 100},   // 18  slot 10
    {0, 0, 100, 0},         // 19  yellow list
    {100, 0, 0, 100},       // 20  slot 3
    {0, 0, 0, 20},          // 21  black list
    {0, 100, 0, 100},       // 22  slot 4
    {0, 0, 60, 0},          // 23  yellow list
    {0, 0, 100, 100},       // 24  slot 5
    {0, 70, 0, 0},          // 25  magenta list
    {0, 100, 100, 100},     // 26  slot 6
    {0, 60, 0, 0},          // 27  magenta list
    {100, 100, 0, 0},       // 28  slot 2 blue
    {20, 0, 0, 0},          // 29  cyan list
    {80, 0, 0, 0},          // 30  cyan list
    {0, 20, 0, 0},          // 31  magenta list
    {0, 0, 0, 90},          // 32  black list
    {40, 0, 0, 0},          // 33  cyan list
    {0, 0, 0, 70},          // 34  black list
    {0, 40, 0, 0},          // 35  magenta list
    {0, 0, 0, 100},         // 36  black list
    {60, 0, 0, 0},          // 37  cyan list
    {0, 0, 70, 0},          // 38  yellow list
    {0, 0, 0, 60},          // 39  black list
    {70, 0, 0, 0},          // 40  cyan list
    {0, 80, 0, 0},          // 41  magenta list
    {100, 0, 100, 100},     // 42  slot 7
    {0, 0, 0, 10},          // 43  black list
    {40, 40, 40, 0},        // 44  slot 11 three-colour grey
    {40, 40, 40, 40},       // 45  slot 12 four-colour grey
};
static_assert(sizeof(MathProfile::dithering) == 46 * 4, "the test form has 46 patches of C, M, Y, K");

namespace {

// Destination of a test-form patch: a slot number, or a tint list (-1 - channel).
int classify(const unsigned char cmyk[4])
{
    const bool c = cmyk[0] != 0, m = cmyk[1] != 0, y = cmyk[2] != 0, k = cmyk[3] != 0;
    const int printed = c + m + y + k;
    if (printed == 0)
        return MathProfile::kSlotPaper;
    if (printed == 1)
        return -1 - (c ? 0 : m ? 1 : y ? 2 : 3);
    if (printed == 2) {
        if (m && y) return 0;
        if (c && y) return 1;
        if (c && m) return 2;
        if (c && k) return 3;
        if (m && k) return 4;
        return 5; // y && k
    }
    if (printed == 3) {
        if (!c) return 6;
        if (!m) return 7;
        if (!y) return 8;
        const bool solids = cmyk[0] == 100 && cmyk[1] == 100 && cmyk[2] == 100;
        return solids ? 9 : 11;
    }
    const bool solids = cmyk[0] == 100 && cmyk[1] == 100 && cmyk[2] == 100 && cmyk[3] == 100;
    return solids ? 10 : 12;
}

double sortKey(const MathProfile::ColorPatch& patch)
{
    double key = patch.channel[0];
    for (int c = 1; c < MathProfile::kChannels; ++c)
        key += patch.channel[c];
    return key;
}

} // namespace

namespace formorientation {

bool readInSwappedHalves(const double* const* rows, double normFactor)
{
    const int probeRows[4] = {0, 24, 1, 25};
    double Z[4];
    for (int p = 0; p < 4; ++p) {
        double XYZ[3];
        colorimetry::spectrumToXYZ(rows[probeRows[p]], normFactor, XYZ);
        Z[p] = XYZ[2];
    }
    return Z[1] > Z[0] && Z[3] > Z[2];
}

void exchangeHalves(double* const* rows)
{
    for (int i = 0; i <= 22; ++i) {
        if (rows[i + 24] == nullptr)
            break;
        double scratch[MathProfile::kBands];
        std::memcpy(scratch, rows[i], sizeof scratch);
        std::memcpy(rows[i], rows[i + 24], sizeof scratch);
        std::memcpy(rows[i + 24], scratch, sizeof scratch);
    }
}

} // namespace formorientation

void MathProfile::readData(double** rows)
{
    if (formorientation::readInSwappedHalves(rows, normFactor))
        formorientation::exchangeHalves(rows);

    for (int i = 0; i < 46; ++i) {
        const int destination = classify(dithering[i]);
        ColorPatch fresh = {};
        ColorPatch& patch = destination >= 0 ? patchSlots[destination] : fresh;
        for (int c = 0; c < 4; ++c)
            patch.channel[c] = dithering[i][c];
        for (int c = 4; c < kChannels; ++c)
            patch.channel[c] = 0.0;
        std::memcpy(patch.spectrum, rows[i], sizeof patch.spectrum);
        if (destination < 0)
            tintLists[-1 - destination].push_back(fresh);
    }
}

void MathProfile::sortData(std::vector<ColorPatch>& list)
{
    const size_t n = list.size();
    if (n < 2)
        return;
    // Exchange sort with whole-record exchanges; equal keys are never
    // exchanged with each other, so the order is not stable (an exchange with
    // a third patch can reverse them). Kept as is: tint selection takes the
    // first patch of a coverage.
    for (size_t i = 0; i + 1 < n; ++i)
        for (size_t j = i + 1; j < n; ++j)
            if (sortKey(list[i]) > sortKey(list[j])) {
                const ColorPatch scratch = list[i];
                list[i] = list[j];
                list[j] = scratch;
            }
}

void profilesteps::readForm(MathProfile& profile, double** rows)
{
    profile.readData(rows);
    for (int list = 0; list < 4; ++list)
        profile.sortData(profile.tintLists[list]);
}

void MathProfile::clearTintLists()
{
    for (auto& list : tintLists)
        list.clear();
}
