// ICC output profiles: the A2B table read as LittleCMS reads it, the rounding
// that holds the ink limits, the black generation, and whole profiles of the
// bundled form through LittleCMS both ways: limits to the last code, paper
// white without ink, K along the neutral axis, the round trip, the tags.
#include "Failure.h"
#include "FourColourForm.h"
#include "PrintProfile.h"
#include "Separation.h"

#include <gtest/gtest.h>
#include <lcms2.h>

#include <array>
#include <cmath>
#include <random>

using namespace veltmarquist;
using namespace veltmarquist::profile;

namespace {

const FoundForm& sampleForm()
{
    static const FoundForm form = [] {
        FileWarnings warnings;
        return readTestForm(VELTMARQUIST_SAMPLES_DIR "/offset_form.txt", ReadOptions{}, warnings);
    }();
    return form;
}

const FittedModel& sampleModel()
{
    static const FittedModel fit = fitModel(sampleForm(), ModelChoice::yuleNielsen);
    return fit;
}

// A small profile of the sample (9 A2B nodes per ink, 17 B2A nodes per axis), and its table.
struct SmallProfile {
    explicit SmallProfile(IccVersion version, const std::string& black = "heavy")
    {
        options.a2bNodes = 9;
        options.b2aNodes = 17;
        options.version = version;
        options.black = *blackGenerationNamed(black);
        options.created = 1700000000;
        bytes = printProfile(sampleModel(), sampleForm(), options, summary);
    }
    ProfileOptions options;
    ProfileSummary summary;
    std::string bytes;
};

struct Cmm {
    explicit Cmm(const std::string& bytes)
        : profile(cmsOpenProfileFromMem(bytes.data(), static_cast<cmsUInt32Number>(bytes.size()))),
          lab(cmsCreateLab4Profile(nullptr))
    {
    }
    ~Cmm()
    {
        for (cmsHTRANSFORM transform : transforms)
            cmsDeleteTransform(transform);
        cmsCloseProfile(lab);
        cmsCloseProfile(profile);
    }
    cmsHTRANSFORM make(bool forward, cmsUInt32Number output, cmsUInt32Number flags = 0)
    {
        transforms.push_back(forward ? cmsCreateTransform(profile, TYPE_CMYK_DBL, lab, TYPE_Lab_DBL,
                                                          INTENT_RELATIVE_COLORIMETRIC, flags)
                                     : cmsCreateTransform(lab, TYPE_Lab_DBL, profile, output,
                                                          INTENT_RELATIVE_COLORIMETRIC, flags));
        return transforms.back();
    }
    cmsHPROFILE profile, lab;
    std::vector<cmsHTRANSFORM> transforms;
};

double deltaE00(const cmsCIELab& a, const cmsCIELab& b)
{
    return cmsCIE2000DeltaE(&a, &b, 1.0, 1.0, 1.0);
}

} // namespace

TEST(PrintProfile, TheForwardTableIsReadAsLittleCmsReadsIt)
{
    for (const IccVersion version : {IccVersion::v2, IccVersion::v4}) {
        SCOPED_TRACE(version == IccVersion::v2 ? "version 2" : "version 4");
        // Even levels for the Yule-Nielsen model, the form's 9 levels (an input curve) for the offset model.
        const FittedModel offset = fitModel(sampleForm(), ModelChoice::offset);
        for (const PrintModel* model : {sampleModel().model.get(), offset.model.get()}) {
            std::vector<double> levels = model->levels();
            if (levels.empty())
                levels = {0, 12.5, 25, 37.5, 50, 62.5, 75, 87.5, 100};
            const ForwardTable table(*model, levels, LabEncoding{version});
            ProfileOptions options;
            options.a2bNodes = levels.size() == 9 && model->levels().empty() ? std::optional<int>(9) : std::nullopt;
            options.b2aNodes = 9;
            options.version = version;
            ProfileSummary summary;
            const FittedModel fit{offset.model.get() == model ? offset.model : sampleModel().model, offset.choice};
            Cmm cmm(printProfile(fit, sampleForm(), options, summary));
            const cmsHTRANSFORM forward = cmm.make(true, 0, cmsFLAGS_NOOPTIMIZE);
            std::mt19937 random(7);
            std::uniform_real_distribution<double> unit(0.0, 1.0);
            double worst = 0.0;
            for (int sample = 0; sample < 400; ++sample) {
                const double device[4] = {unit(random), unit(random), unit(random), sample % 7 == 0 ? 1.0 : unit(random)};
                const double percent[4] = {100 * device[0], 100 * device[1], 100 * device[2], 100 * device[3]};
                cmsCIELab theirs;
                cmsDoTransform(forward, percent, &theirs, 1);
                const Triple ours = table.lab(device);
                worst = std::max({worst, std::fabs(ours[0] - theirs.L), std::fabs(ours[1] - theirs.a),
                                  std::fabs(ours[2] - theirs.b)});
            }
            EXPECT_LT(worst, 0.01) << model->name(); // 16-bit evaluation in the CMM
        }
    }
}

TEST(PrintProfile, RoundedInkHoldsTheLimitsToTheLastCode)
{
    const InkLimits limits{3.0, 0.95};
    EXPECT_EQ(limits.totalCode(), 196605 - kRoundingRoom);
    EXPECT_EQ(limits.blackCode(), 62258);
    const struct {
        std::array<double, 4> ink;
        std::array<std::uint16_t, 4> codes;
    } cases[] = {
        {{0, 0, 0, 0}, {0, 0, 0, 0}},
        {{0.5, 0.25, 0.125, 0.0625}, {32768, 16384, 8192, 4096}}, // rounded half up, within the limits
        {{0.0, 0.0, 0.0, 1.0}, {0, 0, 0, 62258}},                 // K above its limit
        {{1.0, 1.0, 0.05, 0.95}, {65534, 65534, 3275, 62258}},    // at 300 %: the colour inks that rounded up most give back
        {{0.0, 0.0, 0.0, 3.5}, {0, 0, 0, 62258}},                 // black alone, held to its own limit
    };
    for (const auto& c : cases)
        EXPECT_EQ(inkCodes(c.ink, limits), c.codes) << c.ink[0] << " " << c.ink[1] << " " << c.ink[2] << " " << c.ink[3];
    // Separations at and around the limits: held to the last code, every ink within a code or two of its value.
    std::mt19937 random(3);
    std::uniform_real_distribution<double> unit(0.0, 1.0);
    for (int sample = 0; sample < 2000; ++sample) {
        std::array<double, 4> ink = {unit(random), unit(random), unit(random), 0.95 * unit(random)};
        const double sum = ink[0] + ink[1] + ink[2] + ink[3];
        if (sum > 3.0)
            for (double& value : ink)
                value *= 3.0 / sum; // exactly at the limit, as a node that reaches it
        const std::array<std::uint16_t, 4> codes = inkCodes(ink, limits);
        EXPECT_LE(codes[0] + codes[1] + codes[2] + codes[3], limits.totalCode());
        EXPECT_LE(codes[3], limits.blackCode());
        for (size_t i = 0; i < 4; ++i)
            EXPECT_LE(std::fabs(codes[i] - 65535.0 * ink[i]), 2.5) << sample;
    }
}

TEST(PrintProfile, BlackGrowsWithDarknessAndFadesWithChroma)
{
    for (const char* name : {"light", "medium", "heavy", "maximum", "ucr"}) {
        SCOPED_TRACE(name);
        const BlackGeneration black = *blackGenerationNamed(name);
        EXPECT_EQ(black.target(100.0, 0.0, 10.0, 0.95), 0.0);                      // the paper
        EXPECT_NEAR(black.target(10.0, 0.0, 10.0, 0.95), 0.95 * black.amount, 1e-12); // the darkest neutral
        double previous = 0.0;
        for (double L = 100.0; L >= 10.0; L -= 5.0) {
            const double K = black.target(L, 0.0, 10.0, 0.95);
            EXPECT_GE(K, previous) << L;
            previous = K;
        }
        EXPECT_LT(black.target(30.0, 40.0, 10.0, 0.95), black.target(30.0, 0.0, 10.0, 0.95));
    }
    EXPECT_EQ(blackGenerationNamed("none")->target(10.0, 0.0, 10.0, 1.0), 0.0);
    EXPECT_TRUE(blackGenerationNamed("ucr")->fixed);
    EXPECT_FALSE(blackGenerationNamed("ripe"));
}

TEST(PrintProfile, SeparationsHoldTheLimitsKeepWhiteCleanAndTheNeutralBlackRising)
{
    for (const auto& [version, black] : {std::pair{IccVersion::v2, "heavy"}, std::pair{IccVersion::v4, "light"},
                                         std::pair{IccVersion::v2, "ucr"}}) {
        SCOPED_TRACE(std::string(version == IccVersion::v2 ? "version 2, " : "version 4, ") + black);
        const SmallProfile small(version, black);
        Cmm cmm(small.bytes);
        ASSERT_NE(cmm.profile, nullptr);
        const cmsHTRANSFORM toInk = cmm.make(false, TYPE_CMYK_16);
        // A wide CIELAB lattice, mostly outside the gamut, separated at 16 bits.
        std::vector<double> lattice;
        for (int L = 0; L <= 100; L += 5)
            for (int a = -128; a <= 127; a += 8)
                for (int b = -128; b <= 127; b += 8)
                    lattice.insert(lattice.end(), {double(L), double(a), double(b)});
        const size_t count = lattice.size() / 3;
        std::vector<cmsUInt16Number> ink(4 * count);
        cmsDoTransform(toInk, lattice.data(), ink.data(), static_cast<cmsUInt32Number>(count));
        int total = 0, K = 0;
        for (size_t i = 0; i < count; ++i) {
            total = std::max(total, ink[4 * i] + ink[4 * i + 1] + ink[4 * i + 2] + ink[4 * i + 3]);
            K = std::max(K, int(ink[4 * i + 3]));
        }
        EXPECT_LE(total, 3 * 65535); // 300.00 %
        EXPECT_LE(K, 62258);         // 95.00 %
        EXPECT_GT(total, 3 * 65535 - 200) << "the limit is never reached";
        // Paper white: no ink. The neutral axis: K never falls as L* falls.
        std::vector<double> neutral;
        for (int L = 100; L >= 0; --L)
            neutral.insert(neutral.end(), {double(L), 0.0, 0.0});
        std::vector<cmsUInt16Number> axis(4 * 101);
        cmsDoTransform(toInk, neutral.data(), axis.data(), 101);
        EXPECT_EQ(std::vector<cmsUInt16Number>(axis.begin(), axis.begin() + 4), std::vector<cmsUInt16Number>(4, 0));
        for (size_t step = 1; step < 101; ++step)
            EXPECT_GE(axis[4 * step + 3], axis[4 * step - 1]) << "L* " << 100 - step;
        EXPECT_GT(axis[4 * 100 + 3], 30000) << "black in the shadows";
        EXPECT_LE(axis[4 * 100 + 3], 62258);
    }
}

TEST(PrintProfile, NeighbouringSeparationsChangeOnlyAsMuchAsTheirColours)
{
    // A jump between two ways of printing a colour shows where the table is
    // interpolated: the ink halfway between two reproduced neighbours then
    // prints a colour away from halfway between theirs.
    std::vector<double> levels;
    for (int i = 0; i <= 16; ++i)
        levels.push_back(100.0 * i / 16);
    const ForwardTable a2b(*sampleModel().model, levels, LabEncoding{IccVersion::v2});
    for (const char* name : {"heavy", "light"}) {
        SCOPED_TRACE(name);
        const SeparationTable table = separate(a2b, InkLimits{}, *blackGenerationNamed(name), 33);
        const size_t n = 33;
        double worst = 0.0;
        for (size_t node = 0; node < n * n * n; ++node)
            for (const size_t stride : {1 * n * n, n, size_t(1)}) {
                const size_t other = node + stride;
                if (other >= n * n * n || (stride == 1 && node % n == n - 1) || (stride == n && node / n % n == n - 1) ||
                    table.gamut[node] != 0 || table.gamut[other] != 0)
                    continue;
                double ink[4], neighbour[4], halfway[4];
                for (size_t i = 0; i < 4; ++i) {
                    ink[i] = table.entries[4 * node + i] / 65535.0;
                    neighbour[i] = table.entries[4 * other + i] / 65535.0;
                    halfway[i] = 0.5 * (ink[i] + neighbour[i]);
                }
                const Triple p = a2b.lab(ink), q = a2b.lab(neighbour), h = a2b.lab(halfway);
                worst = std::max(worst, std::hypot(h[0] - 0.5 * (p[0] + q[0]), h[1] - 0.5 * (p[1] + q[1]),
                                                   h[2] - 0.5 * (p[2] + q[2])));
            }
        EXPECT_LT(worst, 1.25) << "dE*ab off halfway between neighbouring nodes";
    }
}

TEST(PrintProfile, TheRoundTripReproducesThePressesColours)
{
    ProfileOptions options; // the default tables: 17 A2B nodes per ink, 33 B2A nodes per axis
    ProfileSummary summary;
    Cmm cmm(printProfile(sampleModel(), sampleForm(), options, summary));
    const cmsHTRANSFORM forward = cmm.make(true, 0), inverse = cmm.make(false, TYPE_CMYK_DBL);
    std::vector<double> device;
    for (int c = 0; c <= 100; c += 20)
        for (int m = 0; m <= 100; m += 20)
            for (int y = 0; y <= 100; y += 20)
                for (int k = 0; k <= 80; k += 20)
                    if (c + m + y + k <= 280)
                        device.insert(device.end(), {double(c), double(m), double(y), double(k)});
    const size_t count = device.size() / 4;
    std::vector<cmsCIELab> first(count), second(count);
    std::vector<double> separated(4 * count);
    cmsDoTransform(forward, device.data(), first.data(), static_cast<cmsUInt32Number>(count));
    cmsDoTransform(inverse, first.data(), separated.data(), static_cast<cmsUInt32Number>(count));
    cmsDoTransform(forward, separated.data(), second.data(), static_cast<cmsUInt32Number>(count));
    double sum = 0.0, worst = 0.0;
    for (size_t i = 0; i < count; ++i) {
        const double d = deltaE00(first[i], second[i]);
        sum += d;
        worst = std::max(worst, d);
    }
    EXPECT_LT(sum / count, 0.3);
    EXPECT_LT(worst, 2.0);
}

TEST(PrintProfile, TagsSayWhatTheProfileIsAndBytesRepeat)
{
    const SmallProfile small(IccVersion::v2);
    EXPECT_EQ(small.bytes, SmallProfile(IccVersion::v2).bytes) << "the same options give the same bytes";
    Cmm cmm(small.bytes);
    cmsHPROFILE h = cmm.profile;
    EXPECT_EQ(cmsGetDeviceClass(h), cmsSigOutputClass);
    EXPECT_EQ(cmsGetColorSpace(h), cmsSigCmykData);
    EXPECT_EQ(cmsGetPCS(h), cmsSigLabData);
    EXPECT_DOUBLE_EQ(cmsGetProfileVersion(h), 2.4);
    for (cmsTagSignature tag : {cmsSigAToB0Tag, cmsSigAToB1Tag, cmsSigAToB2Tag, cmsSigBToA0Tag, cmsSigBToA1Tag,
                                cmsSigBToA2Tag, cmsSigGamutTag, cmsSigMediaWhitePointTag, cmsSigCharTargetTag,
                                cmsSigProfileDescriptionTag, cmsSigCopyrightTag})
        EXPECT_TRUE(cmsIsTag(h, tag)) << std::hex << tag;
    // One table serves the three intents: the others share its data.
    for (cmsTagSignature tag : {cmsSigAToB1Tag, cmsSigAToB2Tag, cmsSigBToA1Tag, cmsSigBToA2Tag})
        EXPECT_NE(cmsTagLinkedTo(h, tag), cmsTagSignature(0)) << std::hex << tag;
    char text[256] = {};
    cmsGetProfileInfoASCII(h, cmsInfoDescription, "en", "US", text, sizeof text);
    EXPECT_EQ(std::string(text), small.summary.description);
    EXPECT_EQ(std::string(text), "Synthetic offset test form, 46 patches, coated paper, Yule-Nielsen model");
    const auto* white = static_cast<const cmsCIEXYZ*>(cmsReadTag(h, cmsSigMediaWhitePointTag));
    const Triple paper = spectrumToXYZ(sampleForm().measuredForm().spectrum(1));
    EXPECT_NEAR(white->Y * 100, paper[1], 1e-3);
    cmsUInt8Number id[16] = {};
    cmsGetHeaderProfileID(h, id);
    EXPECT_NE(std::vector<cmsUInt8Number>(id, id + 16), std::vector<cmsUInt8Number>(16, 0));
}

TEST(PrintProfile, OptionsNoPressOrProfileHasAreRefused)
{
    const auto refusal = [](const std::function<void(ProfileOptions&)>& change, ModelChoice choice) {
        ProfileOptions options;
        change(options);
        try {
            checkProfileOptions(options, fitModel(sampleForm(), choice).model.get());
        } catch (const HostError& error) {
            return std::to_string(exitCodeOf(error.failure())) + ": " + error.what();
        }
        return std::string();
    };
    const ModelChoice ynsn = ModelChoice::yuleNielsen;
    const std::tuple<std::function<void(ProfileOptions&)>, ModelChoice, std::string> cases[] = {
        {[](ProfileOptions& o) { o.inkLimit = 99.5; }, ynsn, "2: ink limit 99.5: the total ink limit is a percentage"},
        {[](ProfileOptions& o) { o.inkLimit = 150, o.blackLimit = 160; }, ynsn, "2: black limit 160: the black limit"},
        {[](ProfileOptions& o) { o.b2aNodes = 32; }, ynsn, "2: B2A grid 32: a B2A table has an odd number of nodes"},
        {[](ProfileOptions& o) { o.a2bNodes = 17; }, ModelChoice::offset,
         "2: A2B grid 17: the offset model predicts only the form's 9 levels"},
        {[](ProfileOptions& o) { o.a2bNodes = 3; }, ynsn, "2: A2B grid 3: an A2B table has 5 to 33 nodes per ink"},
        {[](ProfileOptions& o) { o.black.shape = 0; }, ynsn, "2: black generation: start and amount lie from 0 to 1"},
        {[](ProfileOptions& o) { o.a2bNodes = 9; }, ModelChoice::gravure, ""},
    };
    for (const auto& [change, choice, message] : cases) {
        SCOPED_TRACE(message);
        const std::string refused = refusal(change, choice);
        EXPECT_EQ(refused.substr(0, message.size()), message);
        EXPECT_EQ(refused.empty(), message.empty());
    }
}
