/* A host written in C: includes the public header as C, checks the version
 * symbols, runs the chart copy (process 7) on a small block, and fits and
 * predicts a print model. */
#include "VeltmarquistDLL.h"

#include <stdio.h>
#include <string.h>

int main(int argc, char **argv)
{
    /* Three patches of 36 bands (the last two are the reference whites),
     * then seven channel values per patch. */
    int block[3 * 36 + 3 * 7];
    char path[4096], text[8192];
    size_t length;
    FILE *chart;
    void *profile, *model = NULL;
    int i, status, form[46 * 36]; /* every patch 500, the paper (patch 1) 900 */
    const double cmyk[2 * 4] = {0, 0, 0, 0, 35, 0, 0, 0};
    double spectra[2 * 36];

    if (argc != 2)
        return 2;
    for (i = 0; i < 3 * 36; ++i)
        block[i] = 100 + 20 * (i % 36);
    for (i = 3 * 36; i < 3 * 36 + 21; ++i)
        block[i] = 40;
    if (strncmp(VeltmarquistDLLVersionString, "@(#)PROGRAM:VeltmarquistDLL  PROJECT:", 37) != 0 ||
        VeltmarquistDLLVersionNumber != 1.0) {
        fprintf(stderr, "version symbols wrong\n");
        return 1;
    }
    snprintf(path, sizeof path, "%s/c_api_smoke.chart", argv[1]);
    profile = CreateMathProfile("C host");
    if (profile == NULL)
        return 1;
    status = CalculateChart(profile, VM_PROCESS_CHART_COPY, path, block, VM_INPUT_10NM, 380, 36, 3);
    DestroyMathProfile(profile);
    DestroyMathProfile(NULL);
    chart = fopen(path, "rb");
    if (status != VM_STATUS_OK || chart == NULL) {
        fprintf(stderr, "process 7 gave %d\n", status);
        return 1;
    }
    length = fread(text, 1, sizeof text - 1, chart);
    fclose(chart);
    text[length] = '\0';
    if (strncmp(text, "LGOROWLENGTH\t54\r\nNUMBER_OF_SETS\t1\n", 34) != 0 ||
        strstr(text, "\n1\t40\t40\t40\t40\t0.1\t0.12\t") == NULL || strcmp(text + length - 9, "END_DATA\n") != 0) {
        fprintf(stderr, "unexpected chart:\n%s", text);
        return 1;
    }
    for (i = 0; i < 46 * 36; ++i)
        form[i] = i / 36 == 1 ? 900 : 500;
    /* The gravure model predicts the paper as measured; C 35 is not on the form. */
    status = FitPrintModel(VM_MODEL_GRAVURE, form, VM_INPUT_10NM, 380, 36, 46, &model);
    if (status != VM_STATUS_OK || PredictPrintModel(model, 1, cmyk, spectra, NULL, NULL) != VM_STATUS_OK ||
        spectra[0] != 0.9 || spectra[35] != 0.9 ||
        PredictPrintModel(model, 2, cmyk, spectra, NULL, NULL) != VM_STATUS_COVERAGE_NOT_PREDICTED) {
        fprintf(stderr, "print model: fit gave %d or an unexpected prediction\n", status);
        return 1;
    }
    DestroyPrintModel(model);
    puts("C host: chart written, model fitted and predicted");
    return 0;
}
