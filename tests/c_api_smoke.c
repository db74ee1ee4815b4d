/* A host written in C: includes the public header as C, runs the chart copy
 * (process 7) on the golden conversion input and compares the bytes. */
#include "VeltmarquistDLL.h"

#include <stdio.h>
#include <stdlib.h>
#include <string.h>

static char *slurp(const char *path, long *size)
{
    FILE *file = fopen(path, "rb");
    char *text;
    if (file == NULL)
        return NULL;
    fseek(file, 0, SEEK_END);
    *size = ftell(file);
    fseek(file, 0, SEEK_SET);
    text = malloc((size_t)*size + 1);
    if (text == NULL || fread(text, 1, (size_t)*size, file) != (size_t)*size) {
        fclose(file);
        free(text);
        return NULL;
    }
    fclose(file);
    return text;
}

int main(int argc, char **argv)
{
    char path[4096];
    FILE *input;
    int kind, first, perPatch, count, total, i, status;
    int *block;
    void *profile;
    char *written, *expected;
    long writtenSize = 0, expectedSize = 0;

    if (argc != 3)
        return 2;
    if (strncmp(VeltmarquistDLLVersionString, "@(#)PROGRAM:VeltmarquistDLL  PROJECT:", 37) != 0 ||
        VeltmarquistDLLVersionNumber != 1.0) {
        fprintf(stderr, "version symbols wrong\n");
        return 1;
    }
    snprintf(path, sizeof path, "%s/conversion.in", argv[1]);
    input = fopen(path, "r");
    if (input == NULL || fscanf(input, "%d %d %d %d %d", &kind, &first, &perPatch, &count, &total) != 5)
        return 1;
    block = calloc((size_t)total, sizeof *block);
    for (i = 0; i < total; ++i)
        if (fscanf(input, "%d", &block[i]) != 1)
            return 1;
    fclose(input);

    profile = CreateMathProfile("C host");
    if (profile == NULL)
        return 1;
    snprintf(path, sizeof path, "%s/c_api_smoke.chart", argv[2]);
    status = CalculateChart(profile, VM_PROCESS_CHART_COPY, path, block, 15, first, perPatch, count);
    if (status != VM_STATUS_UNKNOWN_INPUT_KIND) {
        fprintf(stderr, "unknown input kind gave %d\n", status);
        return 1;
    }
    status = CalculateChart(profile, VM_PROCESS_CHART_COPY, path, block, kind, first, perPatch, count);
    if (status != VM_STATUS_OK) {
        fprintf(stderr, "process 7 gave %d\n", status);
        return 1;
    }
    DestroyMathProfile(profile);
    DestroyMathProfile(NULL);

    written = slurp(path, &writtenSize);
    snprintf(path, sizeof path, "%s/conversion.p7.chart", argv[1]);
    expected = slurp(path, &expectedSize);
    if (written == NULL || expected == NULL || writtenSize != expectedSize ||
        memcmp(written, expected, (size_t)writtenSize) != 0) {
        fprintf(stderr, "chart differs from the golden chart\n");
        return 1;
    }
    free(written);
    free(expected);
    free(block);
    puts("C host: chart matches");
    return 0;
}
