// MathProfile: one characterisation of one print.
//
// The profile holds the measured patches of a printed test form (22 fixed patch
// slots and seven lists of single-channel tints), the tuning values of the two
// four-colour print models, and the constant tables of the library. Every
// calculation is a method; results are left in the object's fields and slots.
//
// Hosts that link this class directly (instead of the C entry points) must
// respect the preconditions stated at each method: the class validates little.
#ifndef VELTMARQUIST_MATHPROFILE_H
#define VELTMARQUIST_MATHPROFILE_H

#include "VeltmarquistDLL.h"

#include <array>
#include <fstream>
#include <vector>

// The library's exception. Code 1: a chart file could not be opened.
class VELTMARQUIST_API Exceptions {
public:
    explicit Exceptions(int errorCode) : code(errorCode) {}
    int code;
};

class VELTMARQUIST_API MathProfile {
public:
    // One patch: coverages, reflectance spectrum (380..730 nm, 10 nm steps,
    // 0..1 scale), per-band Neugebauer weight, and X, Y, Z (0..100 scale).
    struct ColorPatch {
        double channel[7];   // 0 C, 1 M, 2 Y, 3 K, 4..6 further inks; percent
        double spectrum[36]; // band b at 380 + 10 b nm
        double weight[36];   // Demichel weight as a primary of the last offset prediction
        double XYZ[3];
    };
    // Tristimulus values on the 0..1 scale, the argument of XYZ2LAB.
    struct xyz {
        double X, Y, Z;
    };
    // CIELAB values, the result of XYZ2LAB.
    struct lab {
        double L, a, b;
    };

    enum { kBands = 36, kSlots = 22, kChannels = 7 };
    // Patch slots with a fixed meaning.
    enum {
        kSlotPaper = 13,          // paper (no ink); first reference white of a conversion
        kSlotFirstTint = 14,      // 14..20: selected tint (or solid) of channels 0..6
        kSlotSecondWhite = 18,    // second reference white of a conversion
        kSlotCurrentSample = 21   // the patch being predicted or written
    };

    explicit MathProfile(const char* name);
    virtual ~MathProfile();

    MathProfile(const MathProfile&) = delete;
    MathProfile& operator=(const MathProfile&) = delete;

    // -- Measurement marshalling --------------------------------------------
    // Value of the 36-band position `band` (380 + 10 band nm) from 16 values
    // at 400, 420, ..., 700 nm. Reads no field of the object.
    double InterpolateSpectralValue(int band, double* values);

    // -- Colorimetry ------------------------------------------------------------
    // X, Y, Z (D50, 2 degree, 0..100 scale) of the patch's spectrum.
    void spec2XYZ(ColorPatch* patch);
    // CIELAB of X, Y, Z given on the 0..1 scale, ICC D50 white.
    lab XYZ2LAB(xyz value);
    // CIELAB companding function (tabulated cube root between 0.008856 and 1).
    double icc_f(double t);

    // -- Measurement intake (four-colour test form of 46 patches) -------------
    // Precondition: rows 0..45 are present (46 rows of 36 doubles).
    void readData(double** rows);
    // Orders a tint list by ascending coverage (exchange sort, not stable).
    void sortData(std::vector<ColorPatch>& list);
    // Empties the seven tint lists. The library itself never calls this: the
    // lists are only ever appended to, and process 6 relies on the tone ramps
    // that a preceding process 3 or 5 left there. Hosts that reuse one profile
    // for independent four-colour charts call it between them.
    void clearTintLists();

    // -- Print models -------------------------------------------------------------
    void setSample(double c, double m, double y, double k, double e1, double e2, double e3);
    double getDotarea(double tint, double solid, double paper);
    // Offset (Neugebauer) model. An ink whose tint list is empty uses the paper
    // as its solid.
    void calcOffsetSample();
    void calcGravureSampleKCMY();
    void calcGravureSampleYCMK();
    void calcGravureSampleYMKC();
    void calcGravureSampleYKMC();
    void calcGravureSampleCMYK();
    // Seven-ink model of the six- and seven-colour processes.
    void buildTintRamps();
    void calcMultiChannelSample();
    void calcSeparationSample();

    // -- Charts ------------------------------------------------------------------
    // 900-patch XYZ chart. process 0: offset model, 1: gravure model chosen by
    // inkOrder; any other value throws std::invalid_argument before the file is
    // opened. Precondition: 46 rows. Throws Exceptions(1) if `path` cannot be opened.
    void calculateChart(double** rows, PrintProcess process, const char* path);
    // 46-step chart of the test form, measured or modelled (process 0 or 1;
    // with measured false any other process throws std::invalid_argument).
    // Precondition: 46 rows.
    void calculateChart46(double** rows, PrintProcess process, const char* path, bool measured);
    // Processes 3, 5 (spectral chart, fills the exchange buffer) and 6.
    // Preconditions: 10 rows (process 3) or 11 rows (process 5); `measurements`
    // holds VM_EXCHANGE_BUFFER_INTS ints; process 6 follows a process 3 or 5.
    void calculateChartMCH(double** rows, PrintProcess process, const char* path, int* measurements);
    // Processes 7, 8, 9: the last two of `count` rows are the reference whites.
    // Precondition: count >= 2.
    void convertChart(double** rows, int count, const char* path, double* channels, PrintProcess process);

    // -- Correction factors -------------------------------------------------------
    // Fits grayDiffFactor and coverageLimit to the two measured greys.
    // Precondition: 46 rows.
    void calculateGrayDiffFactor(double** rows);
    // The same fit with every score of the coarse grid computed the
    // straightforward way (setSample, calcOffsetSample and XYZ2LAB for both
    // greys). Same fields, same profile state, many times slower: the reference
    // that the fast evaluation is checked and measured against.
    void calculateGrayDiffFactorStraightforward(double** rows);
    // Fits inkOrder and rgbFactor to the measured red, green and blue.
    // Precondition: 46 rows.
    void calculateRGBFactors(double** rows);

    // -- State, in declaration order ---------------------------------------------
    double normFactor;                             // 100 / sum of the Y weights
    ColorPatch patchSlots[kSlots];                 // see the slot table in the README
    std::vector<ColorPatch> tintLists[kChannels];  // single-channel tints per channel
    std::ofstream chartFile;                       // unused: every writer opens its own stream
    double grayDiffFactor[4];                      // offset exponent correction, C M Y K
    double rgbFactor[3];                           // gravure trapping factors
    double coverageLimit;                          // offset correction saturation, percent
    char profileName[1024];
    int inkOrder;                                  // 1 KCMY, 2 YCMK, 3 YMKC, 4 YKMC, other CMYK

    // -- Constant tables ------------------------------------------------------------
    static const double Gewichtsfaktoren_XYZ_D50[36][3];
    static const std::array<float, 1025> cuberoot_samples;
    static const unsigned char dithering[46][4];
    static const std::array<std::array<unsigned char, 4>, 900> toBeCalculated;
    static const std::array<std::array<unsigned char, 6>, 138> toBeCalculatedCLR6;
    static const std::array<std::array<unsigned char, 7>, 169> toBeCalculatedCLR7;
    static const std::array<std::array<unsigned char, 4>, 3500> ZANExtended;
};

#endif // VELTMARQUIST_MATHPROFILE_H
