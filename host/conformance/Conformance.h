// Press conformance: the control patches of a measured test form against a
// reference characterisation data set (such as FOGRA39L.ti3), each with a
// tolerance and a verdict, and the whole gamut of the reference as the
// press's fitted model predicts it.
//
// Control patches: the paper, the C, M, Y and K solids, the overprints red
// (M+Y), green (C+Y), blue (C+M), C+M+Y and C+M+Y+K, and the greys C40 M40
// Y40 and C40 M40 Y40 K40, wherever the reference holds them. Colours are
// CIELAB D50 2 degree: the form's from its spectra, the reference's as it
// states them (LAB fields, else XYZ, else spectra). Tone value increase of
// each ink at every tint of the form: Murray-Davies on a tristimulus channel
// (cyan on X, magenta and black on Y, yellow on Z), the same rule for both
// files; a coverage the reference lacks is interpolated linearly between
// its neighbouring tints.
#ifndef VELTMARQUIST_CONFORMANCE_CONFORMANCE_H
#define VELTMARQUIST_CONFORMANCE_CONFORMANCE_H

#include "ColourDifference.h"
#include "TestForm.h"

#include <optional>
#include <string>
#include <vector>

namespace veltmarquist::conformance {

// A reference data set: C, M, Y, K and CIELAB per combination (repeats averaged).
struct Reference {
    std::string path;
    std::string description; // DESCRIPTOR, else the file name
    std::vector<std::pair<std::string, std::string>> header; // every keyword, in file order
    std::vector<Cmyk> cmyk;
    std::vector<Lab> lab;

    // The CIELAB of a combination, if the reference holds it.
    std::optional<Lab> find(const Cmyk& cmyk) const;
};

// Reads a CGATS/CTI3 file with CMYK_C..CMYK_K and LAB_L..LAB_B, XYZ_X..XYZ_Z
// (D50, 0..100) or spectra. HostError naming the file (and line) otherwise.
Reference readReference(const std::string& path);

// Where the tool looks for a reference given by name (FOGRA39L, or
// FOGRA39L.ti3): the folders of installed reference data sets.
std::vector<std::string> referenceFolders();
// `given` as a path when it names a file, else the first installed
// reference of that name; HostError(InputOpen) naming the folders searched.
std::string locateReference(const std::string& given);

// Tolerances: the solids' from ISO 12647-2:2013 as cited in TAGA 2015
// (3.5 CIEDE2000 for C, M and Y, 5 for K); the others are this project's
// own defaults, not a standard's. A tolerance file changes any of them:
// one "name value" per line (# starts a comment), names paper, cyan,
// magenta, yellow, black, red, green, blue, cmy, cmyk, grey, tone-value.
struct Tolerances {
    double paper = 3.0, cyan = 3.5, magenta = 3.5, yellow = 3.5, black = 5.0; // CIEDE2000
    double red = 5.0, green = 5.0, blue = 5.0, cmy = 5.0, cmyk = 5.0, grey = 3.0;
    double toneValue = 5.0; // tone value increase difference, percentage points

    // The tolerance of a name above ("tone-value" for toneValue); null for another name.
    double* named(const std::string& name);
};
Tolerances readTolerances(const std::string& path);
// Where each default comes from, for the output.
std::string toleranceSource(const std::string& name);

// One control patch compared.
struct ControlPatch {
    std::string name;      // "paper", "cyan", ..., "grey C40 M40 Y40"
    std::string tolerance; // the tolerance's name
    Cmyk cmyk{};
    Lab measured{}, reference{};
    double deltaE00 = 0.0, deltaEab = 0.0;
    std::optional<double> deltaH; // for solids and overprints
    double limit = 0.0;
    bool pass = true;
};

// One ink's tone value increase at one tint of the form.
struct ToneValuePoint {
    int ink = 0;          // 0 C .. 3 K
    double nominal = 0.0; // percent
    double measured = 0.0, reference = 0.0; // tone value increase, percent
    bool interpolated = false; // the reference lacks this coverage
    double limit = 0.0;
    bool pass = true;
};

// The reference's whole patch list as the fitted model predicts it.
struct GamutRegion {
    std::string name; // "all", "neutrals", "skin tones", "dark colours", "saturated colours"
    Summary deltaE00;
};
struct GamutPatch {
    Cmyk cmyk{};
    Lab predicted{}, reference{};
    double deltaE00 = 0.0;
};
struct GamutComparison {
    std::string model;
    std::vector<GamutRegion> regions;
    std::vector<GamutPatch> worst; // up to ten, worst first
    std::vector<GamutPatch> all;   // every patch, in the reference's order
};

// Why two files' measurement conditions differ ("measurement condition M1
// against M0"), empty when they agree or one does not say.
std::vector<std::string> conditionMismatches(const MeasurementFile& measured, const Reference& reference);
// The mismatches refused (Failure::Usage naming them and the way to compare
// anyway) unless `anyCondition`; then the notes to show with the result.
std::vector<std::string> checkConditions(const MeasurementFile& measured, const Reference& reference,
                                         bool anyCondition);

struct ConformanceResult {
    std::vector<ControlPatch> controls;
    std::vector<ToneValuePoint> toneValues;
    std::vector<std::string> absent; // control patches the reference does not hold
    std::optional<GamutComparison> gamut;
    std::vector<std::string> conditionNotes; // mismatches allowed by the user, or conditions not stated
    bool pass() const;
    // Control patches and tone values checked, and how many of them fail.
    int checks() const { return static_cast<int>(controls.size() + toneValues.size()); }
    int failures() const;
};

// Compares the form with the reference. `model` (fitted to the form)
// predicts the reference's patch list; null skips the whole-gamut part.
ConformanceResult compare(const FoundForm& form, const Reference& reference, const Tolerances& tolerances,
                          const PrintModel* model);

} // namespace veltmarquist::conformance

#endif // VELTMARQUIST_CONFORMANCE_CONFORMANCE_H
