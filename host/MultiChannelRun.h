// The six- and seven-ink processes on one profile, as every front end runs
// them:
// 1. the spectral chart of the paper and the solids (process 3 or 5), which
//    leaves seven 101-step tone ramps in the profile and the 3499 extended
//    C, M, Y, K combinations in the exchange buffer;
// 2. the separation software separates those combinations into the inks;
// 3. the XYZ chart of the separations (process 6), predicted from the ramps.
//
//     MultiChannelRun run(form, "six.txt", 6);            // the paper and solids found
//     run.writeChart(chart);                              // step 1 into a PendingOutput
//     std::string combinations = run.combinationsText();  // for the separation software
//     run.writeSeparated(separationsOf(answer, "answer.txt", 6), separated);
#ifndef VELTMARQUIST_HOST_MULTICHANNELRUN_H
#define VELTMARQUIST_HOST_MULTICHANNELRUN_H

#include "LibraryBlock.h"
#include "LibraryHost.h"
#include "MeasurementFile.h"
#include "OutputFile.h"
#include "PatchMatching.h"

#include "models/PrintModels.h"

#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>
#include <vector>

namespace veltmarquist {

// The separation software's answer: the channel values of every combination
// in combination order, `channels` per combination (the form's ink count, or
// seven), in kDeviceUnits per percent.
struct Separations {
    std::size_t channels = 0;
    std::vector<std::int32_t> values;
};

class MultiChannelRun {
public:
    // Finds the paper and the solids of the form (device fields nCLR_1 ...
    // nCLR_n, n = inks, which is 6 or 7). HostErrors name `path`: other
    // device fields, missing patches (every one at once).
    MultiChannelRun(const MeasurementFile& form, const std::string& path, int inks);

    // Runs process 3 or 5 into the chart's temporary file; first, once.
    void writeChart(const PendingOutput& chart);

    int inks() const { return inks_; }
    // The patches found: C, M, Y, K solids, paper, three places the processes
    // do not read (filled with the paper), then the further inks' solids.
    const PickedPatches& picked() const { return picked_; }

    // After writeChart: the extended combinations the chart left in the exchange buffer, and as
    // the CGATS text a separation software reads.
    std::vector<Cmyk> combinations() const;
    std::string combinationsText() const;

    // Runs process 6 on the separations into the output's temporary file.
    // Refuses (InputContent) a count of combinations other than 3499 and a
    // channel count other than the inks' (or seven); a value outside 0..100 %
    // is refused naming the combination.
    void writeSeparated(const Separations& separations, const PendingOutput& output);

    // The tone ramps the chart built (101 tones, 0..100 %, per ink in the
    // form's channel order), as the library holds them.
    std::vector<std::vector<Spectrum>> ramps();

    // The library's channel of each of the form's channels: seven map one to
    // one; six inks put ink B on channel 6, channel 5 stays unprinted, as the
    // six-colour model does.
    static std::vector<std::size_t> libraryChannels(int inks);
    // "combination 17 (C 0 M 40 Y 100 K 0)", record counted from 0.
    static std::string combinationLabel(std::size_t record);

private:
    int inks_;
    std::string name_;
    PickedPatches picked_;
    MeasurementBlock block_;
    std::unique_ptr<Profile> profile_;
};

// The separations of a CGATS file: by SAMPLE_ID 1..3499 when every set has a
// numeric one, else in file order; the device fields 7CLR_1 ... 7CLR_7, or
// 6CLR_1 ... 6CLR_6 for six inks. HostErrors name the file and line: a
// sample that is not a combination, a combination named twice, a missing one.
Separations separationsOf(const MeasurementFile& file, const std::string& path, int inks);

} // namespace veltmarquist

#endif // VELTMARQUIST_HOST_MULTICHANNELRUN_H
