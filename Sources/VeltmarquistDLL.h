/*
 * VeltmarquistDLL - spectral print models and characterisation charts.
 *
 * The C interface of the library. A host creates one profile, runs one or more
 * calculations on it and destroys it:
 *
 *     void *profile = CreateMathProfile("press 4, coated");
 *     int status = CalculateChart(profile, VM_PROCESS_OFFSET, "chart.txt",
 *                                 measurements, VM_INPUT_10NM, 380, 36, 46);
 *     if (status == VM_STATUS_OK || status == VM_STATUS_UNKNOWN_INPUT_KIND ||
 *         status == VM_STATUS_INVALID_MEASUREMENTS ||
 *         status == VM_STATUS_OUT_OF_MEMORY)
 *         DestroyMathProfile(profile);   // otherwise the library already did
 *
 * Measurements are integers: reflectance factor x 1000 (1000 = perfect white),
 * patch after patch. The library writes the chart file at `path` and, for the
 * six- and seven-colour processes, integers back into the measurement block.
 *
 * Valid C (C89 and later) and C++; no exception ever leaves these functions.
 */
#ifndef VELTMARQUIST_DLL_H
#define VELTMARQUIST_DLL_H

/* ---- Export macro --------------------------------------------------------
 * VELTMARQUIST_BUILD is defined only while the library itself is compiled. */
#if defined(_WIN32) || defined(__CYGWIN__)
#  if defined(VELTMARQUIST_BUILD)
#    define VELTMARQUIST_API __declspec(dllexport)
#  else
#    define VELTMARQUIST_API __declspec(dllimport)
#  endif
#elif defined(__GNUC__) || defined(__clang__)
#  define VELTMARQUIST_API __attribute__((visibility("default")))
#else
#  define VELTMARQUIST_API
#endif

#ifdef __cplusplus
extern "C" {
#endif

/* ---- Print processes ------------------------------------------------------
 * Passed as a plain int. Every value not listed (2, 4, -1, 10, ...) runs the
 * same calculation as VM_PROCESS_OFFSET.                                     */
typedef enum PrintProcess {
    VM_PROCESS_OFFSET = 0,        /* fit the offset model to the greys, write the 900-patch XYZ chart */
    VM_PROCESS_GRAVURE = 1,       /* 900-patch XYZ chart from the gravure model                      */
    VM_PROCESS_SIX_COLOUR = 3,    /* six-colour spectral chart (128 patches), fills the exchange buffer */
    VM_PROCESS_SEVEN_COLOUR = 5,  /* seven-colour spectral chart (159 patches), fills the buffer        */
    VM_PROCESS_SEPARATED_SET = 6, /* XYZ chart of the host's separations of the 3499 combinations       */
    VM_PROCESS_CHART_COPY = 7,    /* measured chart written unchanged as a spectral chart              */
    VM_PROCESS_CHART_CONVERT = 8, /* chart converted from the first reference white to the second      */
    VM_PROCESS_CHART_BLEND = 9,   /* blend of converted and measured chart, weighted by the whites' dE */
    /* Keep the enumeration as wide as int, so that any int is a valid value. */
    VM_PROCESS_INT_MIN_ = -2147483647 - 1,
    VM_PROCESS_INT_MAX_ = 2147483647
} PrintProcess;

/* ---- Input kinds ---------------------------------------------------------- */
enum {
    VM_INPUT_10NM = 10,  /* valuesPerPatch bands (1 to 100) in 10 nm steps from firstWavelength */
    VM_INPUT_16BAND = 20 /* 16 bands, 400 to 700 nm in 20 nm steps; firstWavelength unused      */
};

/* ---- Status codes -----------------------------------------------------------
 *
 *  code  name                              meaning                                   profile afterwards
 *  ----  --------------------------------  ----------------------------------------  ------------------
 *  0     VM_STATUS_OK                      chart written, model fitted or predicted  alive
 *  1     VM_STATUS_FILE_NOT_OPENED         chart file could not be opened            destroyed
 *  2     VM_STATUS_UNKNOWN_INPUT_KIND      inputKind is neither 10 nor 20            alive
 *  3     VM_STATUS_CALCULATION_FAILED      the calculation failed (an exception)     destroyed
 *  4     VM_STATUS_INVALID_MEASUREMENTS    invalid measurement block (see below)     alive
 *  5     VM_STATUS_OUT_OF_MEMORY           a scratch buffer could not be allocated   alive
 *  6     VM_STATUS_UNKNOWN_MODEL           the model selector names no model here    (print models only)
 *  7     VM_STATUS_INVALID_ARGUMENT        a null or out-of-range argument           (print models only)
 *  8     VM_STATUS_COVERAGE_NOT_PREDICTED  a coverage the model does not predict     (print models only)
 *  9     VM_STATUS_UNKNOWN_HANDLE          not a live model of this library          (print models only)
 *
 * CalculateChart returns 0 to 5. Status 2 is checked first, then status 4;
 * statuses 2, 4 and 5 write no file.
 * Status 4 (nothing allocated, nothing written) is returned for:
 *  - a null profile, path or measurements pointer;
 *  - count above 1999, or below what the process reads: 46 for processes 0,
 *    1 and every value that runs as 0; 10 for 3; 11 for 5; 1 for 6; 2 for 7-9;
 *  - kind 10 with valuesPerPatch outside 1 to 100; with firstWavelength above
 *    380 and (firstWavelength above 740 or more than 36 values per patch); or
 *    with a band layout that places no measured band at its own wavelength
 *    between 380 and 730 nm (for example every band below 380 nm);
 *  - kind 20 with valuesPerPatch other than 16;
 *  - process 6 on a profile that holds no tone ramps of a preceding process
 *    3 or 5 (one of its seven tint lists is empty).
 * Write errors after the file was opened are not detected (status 0).
 * The print-model functions never destroy a model; their statuses are stated
 * at each of them.                                                           */
enum {
    VM_STATUS_OK = 0,
    VM_STATUS_FILE_NOT_OPENED = 1,
    VM_STATUS_UNKNOWN_INPUT_KIND = 2,
    VM_STATUS_CALCULATION_FAILED = 3,
    VM_STATUS_INVALID_MEASUREMENTS = 4,
    VM_STATUS_OUT_OF_MEMORY = 5,
    VM_STATUS_UNKNOWN_MODEL = 6,
    VM_STATUS_INVALID_ARGUMENT = 7,
    VM_STATUS_COVERAGE_NOT_PREDICTED = 8,
    VM_STATUS_UNKNOWN_HANDLE = 9
};

/* Number of ints that the measurement block of processes 3, 5 and 6 must hold:
 * 3499 exchange records of seven ints. The library cannot check the length of
 * the host's buffer; a shorter buffer is overrun.                            */
#define VM_EXCHANGE_RECORDS 3499
#define VM_EXCHANGE_BUFFER_INTS 24493

/* ---- Version --------------------------------------------------------------- */
VELTMARQUIST_API extern const char VeltmarquistDLLVersionString[];
VELTMARQUIST_API extern const double VeltmarquistDLLVersionNumber;

/* ---- Entry points ---------------------------------------------------------- */

/* Creates a profile named `name` (may be null; names longer than 1023
 * characters are cut to 1023). Returns null when it cannot be created.       */
VELTMARQUIST_API void *CreateMathProfile(const char *name);

/* Runs one calculation on `profile` and writes its chart to `path`.
 * measurements: count patches of valuesPerPatch ints (reflectance x 1000);
 *   processes 7-9 read 7 channel values per patch (percent) behind them;
 *   processes 3, 5 and 6 use the block as the exchange buffer and need
 *   VM_EXCHANGE_BUFFER_INTS writable ints.
 * Returns a VM_STATUS_* code. After status 1 or 3 the profile is destroyed
 * and must be neither used nor destroyed again.                              */
VELTMARQUIST_API int CalculateChart(void *profile, PrintProcess process, const char *path,
                                    int *measurements, int inputKind, int firstWavelength,
                                    int valuesPerPatch, int count);

/* Destroys a profile; does nothing for null.                                 */
VELTMARQUIST_API void DestroyMathProfile(void *profile);

/* ---- Print models that return values -----------------------------------------
 *
 * A model is fitted once to the four-colour test form and then predicts as
 * many coverages as the host asks for, into the host's arrays:
 *
 *     void *model = NULL;
 *     double cmyk[2 * 4] = {40, 40, 40, 0,  100, 0, 100, 0}, Lab[2 * 3];
 *     int status = FitPrintModel(VM_MODEL_OFFSET, measurements, VM_INPUT_10NM,
 *                                380, 36, 46, &model);
 *     if (status == VM_STATUS_OK)
 *         status = PredictPrintModel(model, 2, cmyk, NULL, NULL, Lab);
 *     DestroyPrintModel(model);
 *
 * A model never changes once fitted: several threads may predict with one
 * model at once; a model destroyed while another thread predicts with it
 * goes once the prediction is done.
 *
 * Model handles are checked: the library keeps the models it handed out and
 * not yet destroyed, and the print-model functions return status 9 for any
 * other handle (a destroyed model, a profile, a pointer to anything else)
 * without touching it; DestroyPrintModel leaves such a handle alone. What
 * cannot be detected: a destroyed model's handle whose address a later fit
 * happens to reuse names that later model. The profile functions
 * (CalculateChart, DestroyMathProfile) check nothing: a model handle passed
 * to them is undefined behaviour.                                            */
enum {
    VM_MODEL_OFFSET = 0,         /* offset model, fitted to the greys as process 0 fits it; the form's levels  */
    VM_MODEL_GRAVURE = 1,        /* gravure model with the defaults of process 1; the form's levels           */
    VM_MODEL_GRAVURE_FITTED = 2, /* gravure model, ink order and factors fitted to red, green and blue       */
    VM_MODEL_YULE_NIELSEN = 3    /* Yule-Nielsen spectral Neugebauer model; every coverage from 0 to 100 %    */
};

/* Values per predicted spectrum: 380 to 730 nm in 10 nm steps.              */
#define VM_SPECTRUM_BANDS 36

/* Fits the model `model` (VM_MODEL_*) to the test form in a measurement block
 * laid out as for CalculateChart with process 0: the same input kinds,
 * validation and band placement, the first 46 patches the form in measuring
 * order, the block only read. A form read in swapped halves is exchanged
 * back as process 0 does (with more than 46 patches that exchange also swaps
 * patches 22 and 46). On status 0 *fitted receives the model; on any other
 * status it is null.
 * Statuses, checked in this order: 2 (input kind), 6 (a selector this library
 * holds no model for), 7 (null `fitted`), 4 (the block), then 5 (a buffer
 * could not be allocated) or 3 (the fit failed, or the fitted model predicts
 * no colour for a patch of the form).
 * Status 4 is returned for a block CalculateChart refuses with 4, a first
 * wavelength of kind 10 that is not a multiple of 10 nm, and a form that
 * cannot be a measurement: a value below -10 or above 1500 (reflectance
 * -0.01 to 1.5; a block on the percent scale lies far above), or a paper
 * that is not brighter (CIE Y) than each of the four solids, which also
 * refuses a block of zeros or of one value.                                */
VELTMARQUIST_API int FitPrintModel(int model, const int *measurements, int inputKind, int firstWavelength,
                                   int valuesPerPatch, int count, void **fitted);

/* Predicts `count` coverages; cmyk holds C, M, Y, K in percent for each.
 * Writes per patch 36 reflectance values (0..1) to spectra, X, Y, Z (D50,
 * 0..100; Y is not limited to 100) to XYZ and L*, a*, b* to Lab; any of the
 * three may be null. None of them may overlap cmyk.
 * Status 7 for a null model, a negative count, or a null cmyk with count
 * above 0; status 9 for a handle that is not a live model; status 8 when any
 * coverage is not finite, lies outside 0..100 or is none of the model's
 * levels: then nothing is written. Status 3 when a prediction is no colour
 * (a reflectance that is not finite or lies outside -0.01..1.5): the arrays
 * then hold the patches before it. Status 0 never hands over such a value.   */
VELTMARQUIST_API int PredictPrintModel(const void *model, int count, const double *cmyk, double *spectra,
                                       double *XYZ, double *Lab);

/* The model's name ("offset", "gravure" or "Yule-Nielsen"), the number of its
 * fitted values, and the coverage levels it predicts (the same for each ink;
 * levelCount 0: every coverage from 0 to 100 %). Any output pointer may be
 * null. Strings and arrays stay valid until the model is destroyed.
 * Status 7 for a null model, 9 for a handle that is not a live model.        */
VELTMARQUIST_API int DescribePrintModel(const void *model, const char **name, int *valueCount,
                                        const double **levels, int *levelCount);

/* Fitted value `index` (0 to valueCount - 1), for display: its name (for
 * example "gray difference factor (C, M, Y, K)"), its numbers (count of them, null when
 * there are none) and its text (the gravure ink order, a warning; "" when
 * there is none). Any output pointer may be null; what they receive stays
 * valid until the model is destroyed. Status 7 for a null model or an index
 * out of range, 9 for a handle that is not a live model.                     */
VELTMARQUIST_API int GetPrintModelValue(const void *model, int index, const char **name, const double **numbers,
                                        int *count, const char **text);

/* Destroys a model; does nothing for null or a handle that is not a live
 * model (one destroyed before, a profile).                                   */
VELTMARQUIST_API void DestroyPrintModel(void *model);

#ifdef __cplusplus
}
#endif

#endif /* VELTMARQUIST_DLL_H */
