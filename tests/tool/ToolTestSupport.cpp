#include "ToolTestSupport.h"

#include "MathProfile.h"

#include <gtest/gtest.h>

#include <dirent.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <sstream>

namespace tooltest {

namespace {

std::string shellQuote(const std::string& text)
{
    std::string quoted = "'";
    for (char c : text)
        quoted += c == '\'' ? std::string("'\\''") : std::string(1, c);
    return quoted + "'";
}

} // namespace

ToolRun runTool(const std::vector<std::string>& arguments, const std::string& folder)
{
    std::string command = "cd " + shellQuote(folder) + " && " + shellQuote(VELTMARQUIST_TOOL);
    for (const std::string& argument : arguments)
        command += " " + shellQuote(argument);
    const std::string out = folder + "/../" + "tool.out", err = folder + "/../" + "tool.err";
    command += " >" + shellQuote(out) + " 2>" + shellQuote(err);
    ToolRun run;
    const int status = std::system(command.c_str());
    run.exitCode = WIFEXITED(status) ? WEXITSTATUS(status) : -1;
    run.out = readFile(out);
    run.err = readFile(err);
    std::remove(out.c_str());
    std::remove(err.c_str());
    return run;
}

TempDir::TempDir()
{
    // The tool's captured output lands beside the working folder, not in it,
    // so that tests can check which files a command left in its folder.
    char pattern[] = "/tmp/veltmarquist-tool-XXXXXX";
    const char* outer = ::mkdtemp(pattern);
    EXPECT_NE(outer, nullptr);
    dir_ = std::string(outer != nullptr ? outer : "/tmp") + "/work";
    EXPECT_EQ(::mkdir(dir_.c_str(), 0755), 0);
}

TempDir::~TempDir()
{
    const std::string outer = dir_.substr(0, dir_.rfind('/'));
    std::system(("rm -rf '" + outer + "'").c_str());
}

std::vector<std::string> TempDir::files() const
{
    std::vector<std::string> names;
    if (DIR* folder = ::opendir(dir_.c_str())) {
        while (const dirent* entry = ::readdir(folder)) {
            const std::string name = entry->d_name;
            if (name != "." && name != "..")
                names.push_back(name);
        }
        ::closedir(folder);
    }
    std::sort(names.begin(), names.end());
    return names;
}

std::string readFile(const std::string& path)
{
    std::ifstream in(path, std::ios::binary);
    std::ostringstream text;
    text << in.rdbuf();
    return text.str();
}

void writeFile(const std::string& path, const std::string& text)
{
    std::ofstream out(path, std::ios::binary);
    out << text;
}

std::string goldenPath(const std::string& name)
{
    return std::string(VELTMARQUIST_GOLDEN_DIR) + "/" + name;
}

std::string samplePath(const std::string& name)
{
    return std::string(VELTMARQUIST_SAMPLES_DIR) + "/" + name;
}

std::string realDataPath()
{
    const std::string path = std::string(VELTMARQUIST_SHARED_DATA_DIR) + "/APTEC_PC10_CardBoard_2023_v1_Spectral.txt";
    return std::ifstream(path).good() ? path : std::string();
}

GoldenBlock readGolden(const std::string& name)
{
    std::ifstream in(goldenPath(name));
    GoldenBlock block;
    size_t total = 0;
    in >> block.inputKind >> block.firstWavelength >> block.valuesPerPatch >> block.count >> total;
    block.ints.resize(total);
    for (int& value : block.ints)
        in >> value;
    EXPECT_TRUE(in) << "golden input " << name;
    return block;
}

std::string GoldenBlock::value(int patch, int j) const
{
    char text[32];
    std::snprintf(text, sizeof text, "%g", ints[static_cast<size_t>(patch * valuesPerPatch + j)] / 1000.0);
    return text;
}

std::vector<std::string> GoldenBlock::spectralFields() const
{
    std::vector<std::string> names;
    for (int j = 0; j < valuesPerPatch; ++j)
        names.push_back(inputKind == 20 ? "nm" + std::to_string(400 + 20 * j)
                                        : "SPECTRAL_NM" + std::to_string(firstWavelength + 10 * j));
    return names;
}

std::string cgats(const std::vector<std::string>& fields, const std::vector<Row>& rows)
{
    std::string text = "CGATS.17\nORIGINATOR\t\"tool tests\"\nNUMBER_OF_FIELDS\t" + std::to_string(fields.size()) +
                       "\nBEGIN_DATA_FORMAT\n";
    for (size_t i = 0; i < fields.size(); ++i)
        text += (i ? "\t" : "") + fields[i];
    text += "\nEND_DATA_FORMAT\nNUMBER_OF_SETS\t" + std::to_string(rows.size()) + "\nBEGIN_DATA\n";
    for (const Row& row : rows) {
        for (size_t i = 0; i < row.size(); ++i)
            text += (i ? "\t" : "") + row[i];
        text += "\n";
    }
    return text + "END_DATA\n";
}

std::vector<std::string> testFormFields(const GoldenBlock& block)
{
    std::vector<std::string> fields{"SAMPLE_ID", "CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K"};
    for (const std::string& name : block.spectralFields())
        fields.push_back(name);
    return fields;
}

std::vector<Row> testFormRows(const GoldenBlock& block)
{
    std::vector<Row> rows;
    for (int patch = 0; patch < 46; ++patch) {
        Row row{std::to_string(patch + 1)};
        for (int channel = 0; channel < 4; ++channel)
            row.push_back(std::to_string(MathProfile::dithering[patch][channel]));
        for (int j = 0; j < block.valuesPerPatch; ++j)
            row.push_back(block.value(patch, j));
        rows.push_back(row);
    }
    return rows;
}

veltmarquist::MeasurementFile parse(const std::string& path)
{
    veltmarquist::ReadResult result = veltmarquist::readMeasurementText(readFile(path));
    EXPECT_TRUE(result.ok()) << path << ": " << result.error.describe();
    return result.ok() ? *result.file : veltmarquist::MeasurementFile{};
}

} // namespace tooltest
