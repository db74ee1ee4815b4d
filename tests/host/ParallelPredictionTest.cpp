// Large batches split over threads: the values and the refusals of one call.
#include "FourColourForm.h"
#include "ParallelPrediction.h"

#include <gtest/gtest.h>

#include <cstring>
#include <random>

using namespace veltmarquist;

TEST(ParallelPrediction, GivesTheBitsAndRefusalsOfOneCall)
{
    FileWarnings warnings;
    const FoundForm form = readTestForm(VELTMARQUIST_SAMPLES_DIR "/offset_form.txt", ReadOptions{}, warnings);
    const FittedModel fit = fitModel(form, ModelChoice::yuleNielsen);
    const std::size_t count = 3 * kParallelBatch + 17; // slices of unequal length
    std::vector<double> cmyk(4 * count);
    std::mt19937 random(5);
    std::uniform_real_distribution<double> coverage(0.0, 100.0);
    for (double& value : cmyk)
        value = coverage(random);
    std::vector<double> spectra(36 * count), XYZ(3 * count), Lab(3 * count);
    std::vector<double> oneSpectra(36 * count), oneXYZ(3 * count), oneLab(3 * count);
    fit.model->predict(count, cmyk.data(), oneSpectra.data(), oneXYZ.data(), oneLab.data());
    for (unsigned threads : {0u, 2u, 3u}) {
        SCOPED_TRACE(threads);
        predictInParallel(*fit.model, count, cmyk.data(), spectra.data(), XYZ.data(), Lab.data(), threads);
        EXPECT_EQ(std::memcmp(spectra.data(), oneSpectra.data(), spectra.size() * sizeof(double)), 0);
        EXPECT_EQ(std::memcmp(XYZ.data(), oneXYZ.data(), XYZ.size() * sizeof(double)), 0);
        EXPECT_EQ(std::memcmp(Lab.data(), oneLab.data(), Lab.size() * sizeof(double)), 0);
    }
    // A coverage refused in the last slice: named by its place in the whole
    // batch, and nothing written anywhere.
    cmyk[4 * (count - 2) + 1] = 101.0;
    std::vector<double> untouched(3 * count, -1.0);
    try {
        predictInParallel(*fit.model, count, cmyk.data(), nullptr, untouched.data(), nullptr, 3);
        FAIL() << "expected a refusal";
    } catch (const std::invalid_argument& refusal) {
        EXPECT_EQ(std::string(refusal.what()).rfind("patch " + std::to_string(count - 2) + ": M 101", 0), 0u)
            << refusal.what();
    }
    EXPECT_EQ(untouched, std::vector<double>(3 * count, -1.0));
}
