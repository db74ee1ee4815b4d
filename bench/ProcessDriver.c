/* One CalculateChart job as a process of its own, for the whole-process
 * benchmark: reads a measurement block (kind, first wavelength, values per
 * patch, patch count, int count, then the ints), runs PROCESS on it into
 * CHART and exits with the library's status.
 *
 *     ProcessDriver BLOCK PROCESS CHART
 *
 * The same source is linked against the library and against its literal
 * build, so that both are timed from the same driver. */
#include "VeltmarquistDLL.h"

#include <stdio.h>
#include <stdlib.h>

int main(int argc, char** argv)
{
    if (argc != 4) {
        fprintf(stderr, "usage: %s BLOCK PROCESS CHART\n", argv[0]);
        return 64;
    }
    FILE* in = fopen(argv[1], "r");
    if (!in) {
        perror(argv[1]);
        return 66;
    }
    int kind = 0, first = 0, perPatch = 0, patches = 0, count = 0;
    if (fscanf(in, "%d %d %d %d %d", &kind, &first, &perPatch, &patches, &count) != 5 || count < 0 ||
        count > VM_EXCHANGE_BUFFER_INTS) {
        fprintf(stderr, "%s: not a measurement block\n", argv[1]);
        return 65;
    }
    int* values = calloc(VM_EXCHANGE_BUFFER_INTS, sizeof *values);
    for (int i = 0; values && i < count; ++i)
        if (fscanf(in, "%d", &values[i]) != 1) {
            fprintf(stderr, "%s: value %d missing\n", argv[1], i + 1);
            return 65;
        }
    fclose(in);
    void* profile = CreateMathProfile("driver");
    const int status = CalculateChart(profile, (PrintProcess)atoi(argv[2]), argv[3], values, kind, first, perPatch,
                                      patches);
    if (status == VM_STATUS_FILE_NOT_OPENED || status == VM_STATUS_CALCULATION_FAILED)
        profile = NULL; /* the call destroyed it */
    DestroyMathProfile(profile);
    free(values);
    return status;
}
