/* A C host of the library: reads the bundled offset test form and writes
 * the 900-patch offset characterisation chart (process 0).
 *
 *     c_host samples/offset_form.txt chart.txt
 *
 * The form must list its 46 patches in measuring order with fields SAMPLE_ID,
 * SAMPLE_NAME, CMYK_C..CMYK_K and 36 bands 380-730 nm (0-1 scale), as
 * samples/offset_form.txt does. For measurement files in any order, layout or
 * dialect use the veltmarquist tool, which picks the patches by their C, M,
 * Y, K values. */
#include <VeltmarquistDLL.h>

#include <ctype.h>
#include <stdio.h>
#include <stdlib.h>
#include <string.h>

#define PATCHES 46
#define BANDS 36
#define LEADING_FIELDS 6 /* SAMPLE_ID, SAMPLE_NAME, CMYK_C, CMYK_M, CMYK_Y, CMYK_K */

/* Reflectance x 1000 of a decimal text such as "0.1235", rounded half away
 * from zero on the digits as written: converting through a double first
 * would round 0.1235 (stored as 0.12349999...) down to 123. */
static int thousandths(const char *text)
{
    int sign = 1, value = 0, digits = 0;
    if (*text == '-' || *text == '+')
        sign = *text++ == '-' ? -1 : 1;
    for (; isdigit((unsigned char)*text); ++text)
        value = value * 10 + (*text - '0');
    if (*text == '.')
        for (++text; isdigit((unsigned char)*text); ++text, ++digits) {
            if (digits < 3)
                value = value * 10 + (*text - '0');
            else if (digits == 3 && *text >= '5')
                ++value; /* half or more of the last thousandth */
        }
    for (; digits < 3; ++digits)
        value *= 10;
    return sign * value;
}

/* Reads the data rows into measurements (reflectance x 1000); returns the
 * number of rows read. */
static int readForm(const char *path, int *measurements)
{
    char line[8192];
    int rows = 0, inData = 0;
    FILE *file = fopen(path, "r");
    if (file == NULL)
        return -1;
    while (rows < PATCHES && fgets(line, sizeof line, file) != NULL) {
        char *field, *rest = line;
        int column = 0;
        if (!inData) {
            inData = strncmp(line, "BEGIN_DATA", 10) == 0 && strncmp(line, "BEGIN_DATA_FORMAT", 17) != 0;
            continue;
        }
        while ((field = strtok(rest, "\t\r\n")) != NULL && column < LEADING_FIELDS + BANDS) {
            rest = NULL;
            if (column >= LEADING_FIELDS)
                measurements[rows * BANDS + column - LEADING_FIELDS] = thousandths(field);
            ++column;
        }
        if (column == LEADING_FIELDS + BANDS)
            ++rows;
    }
    fclose(file);
    return rows;
}

int main(int argc, char **argv)
{
    static int measurements[PATCHES * BANDS];
    void *profile;
    int status;

    if (argc != 3) {
        fprintf(stderr, "usage: %s FORM CHART\n", argv[0]);
        return 2;
    }
    if (readForm(argv[1], measurements) != PATCHES) {
        fprintf(stderr, "%s: expected %d patches of %d bands in measuring order\n", argv[1], PATCHES, BANDS);
        return 1;
    }

    profile = CreateMathProfile("C host");
    if (profile == NULL)
        return 1;
    status = CalculateChart(profile, VM_PROCESS_OFFSET, argv[2], measurements, VM_INPUT_10NM, 380, BANDS,
                            PATCHES);
    /* After statuses 1 and 3 the library has destroyed the profile itself. */
    if (status != VM_STATUS_FILE_NOT_OPENED && status != VM_STATUS_CALCULATION_FAILED)
        DestroyMathProfile(profile);
    if (status != VM_STATUS_OK) {
        fprintf(stderr, "CalculateChart returned status %d\n", status);
        return 1;
    }
    printf("library version %.1f: offset chart of %s written to %s\n", VeltmarquistDLLVersionNumber, argv[1],
           argv[2]);
    return 0;
}
