#include "TestSupport.h"

#include <gtest/gtest.h>

#include <cmath>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <stdexcept>

namespace testsupport {

std::string goldenPath(const std::string& name)
{
    return std::string(VELTMARQUIST_GOLDEN_DIR) + "/" + name;
}

std::string readFile(const std::string& path)
{
    std::ifstream in(path, std::ios::binary);
    if (!in)
        throw std::runtime_error("cannot read " + path);
    std::ostringstream text;
    text << in.rdbuf();
    return text.str();
}

MeasurementBlock readGoldenInput(const std::string& name)
{
    std::istringstream in(readFile(goldenPath(name)));
    MeasurementBlock block;
    int n = 0;
    in >> block.inputKind >> block.firstWavelength >> block.valuesPerPatch >> block.count >> n;
    block.ints.assign(static_cast<size_t>(std::max(n, VM_EXCHANGE_BUFFER_INTS)), 0);
    for (int i = 0; i < n; ++i)
        in >> block.ints[static_cast<size_t>(i)];
    if (!in)
        throw std::runtime_error("malformed golden input " + name);
    return block;
}

MeasurementBlock withSeparations(MeasurementBlock block)
{
    std::istringstream in(readFile(goldenPath("multichannel.separations")));
    for (int i = 0; i < VM_EXCHANGE_BUFFER_INTS; ++i)
        in >> block.ints[static_cast<size_t>(i)];
    if (!in)
        throw std::runtime_error("malformed golden separations");
    return block;
}

int calculateBlock(void* profile, int process, const std::string& path, MeasurementBlock& block)
{
    return CalculateChart(profile, static_cast<PrintProcess>(process), path.c_str(), block.ints.data(),
                          block.inputKind, block.firstWavelength, block.valuesPerPatch, block.count);
}

std::string chartOf(MeasurementBlock block, int process)
{
    TempDir dir;
    void* profile = CreateMathProfile("chart");
    const int status = calculateBlock(profile, process, dir.path("c"), block);
    EXPECT_EQ(status, VM_STATUS_OK) << "process " << process;
    DestroyMathProfile(profile);
    return status == VM_STATUS_OK ? readFile(dir.path("c")) : std::string();
}

std::vector<std::vector<double>> spectraOf(const MeasurementBlock& block)
{
    std::vector<std::vector<double>> spectra(static_cast<size_t>(block.count));
    for (size_t i = 0; i < spectra.size(); ++i)
        for (size_t j = 0; j < 36; ++j)
            spectra[i].push_back(block.ints[i * static_cast<size_t>(block.valuesPerPatch) + j] / 1000.0);
    return spectra;
}

RowTable::RowTable(const std::vector<std::vector<double>>& spectra) : storage_(spectra), table_(2000, nullptr)
{
    for (size_t i = 0; i < storage_.size(); ++i)
        table_[i] = storage_[i].data();
}

namespace {

double gauss(double x, double centre, double width)
{
    const double t = (x - centre) / width;
    return std::exp(-t * t);
}

double sigmoid(double x, double centre, double width)
{
    return 1.0 / (1.0 + std::exp(-(x - centre) / width));
}

// Reflectance at `nm` of a C, M, Y, K combination: Yule-Nielsen spectral
// Neugebauer with Demichel weights, dot gain on every ink, and overprint
// primaries formed with imperfect trapping.
double printedReflectance(const double cmyk[4], double nm, int variant)
{
    const double paper = 0.87 - 0.22 * gauss(nm, 380, 35) + 0.05 * gauss(nm, 440, 18);
    // Transmission-like relative reflectance of each solid ink film.
    const double film[4] = {
        0.07 + 0.80 * gauss(nm, 475, 60),                                  // cyan
        0.06 + 0.55 * gauss(nm, 420, 45) + 0.88 * sigmoid(nm, 600, 14),    // magenta
        0.05 + 0.90 * sigmoid(nm, 505, 13),                                // yellow
        0.025 + 0.012 * (nm - 380) / 350,                                  // black
    };
    const double gain = 0.14 + 0.025 * variant;
    const double trap = 0.92 - 0.03 * variant;
    const double n = 1.7 + 0.1 * variant;

    double area[4];
    for (int i = 0; i < 4; ++i) {
        const double a = cmyk[i] / 100.0;
        area[i] = a + 4.0 * gain * a * (1.0 - a) * (1.0 - 0.2 * i / 3.0);
    }
    double sum = 0.0;
    for (int mask = 0; mask < 16; ++mask) {
        double weight = 1.0;
        double primary = paper;
        int printed = 0;
        for (int i = 0; i < 4; ++i) {
            if (mask & (1 << i)) {
                weight *= area[i];
                primary *= std::pow(film[i], printed == 0 ? 1.0 : std::pow(trap, printed));
                ++printed;
            } else {
                weight *= 1.0 - area[i];
            }
        }
        sum += weight * std::pow(primary, 1.0 / n);
    }
    return std::pow(sum, n);
}

} // namespace

std::vector<std::vector<double>> syntheticForm(int variant)
{
    std::vector<std::vector<double>> form(46, std::vector<double>(36));
    for (int i = 0; i < 46; ++i) {
        const double cmyk[4] = {static_cast<double>(MathProfile::dithering[i][0]),
                                static_cast<double>(MathProfile::dithering[i][1]),
                                static_cast<double>(MathProfile::dithering[i][2]),
                                static_cast<double>(MathProfile::dithering[i][3])};
        for (int b = 0; b < 36; ++b)
            form[static_cast<size_t>(i)][static_cast<size_t>(b)] =
                std::round(printedReflectance(cmyk, 380 + 10 * b, variant) * 1000.0) / 1000.0;
    }
    return form;
}

TempDir::TempDir()
{
    char pattern[] = "/tmp/veltmarquist-test-XXXXXX";
    const char* made = mkdtemp(pattern);
    if (made == nullptr)
        throw std::runtime_error("cannot create a temporary folder");
    dir_ = made;
}

TempDir::~TempDir()
{
    std::error_code ignored;
    std::filesystem::remove_all(dir_, ignored);
}

std::vector<std::string> lines(const std::string& text)
{
    std::vector<std::string> result;
    std::istringstream in(text);
    for (std::string line; std::getline(in, line);)
        result.push_back(line);
    return result;
}

std::vector<std::string> fields(const std::string& line)
{
    std::vector<std::string> result;
    std::istringstream in(line + "\n");
    for (std::string field; std::getline(in, field, '\t');)
        result.push_back(field);
    if (!result.empty() && !result.back().empty())
        result.back().pop_back(); // the appended line end
    return result;
}

} // namespace testsupport
