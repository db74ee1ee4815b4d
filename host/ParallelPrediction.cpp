// Predicting large batches on every core.
#include "ParallelPrediction.h"

#include <algorithm>
#include <exception>
#include <stdexcept>
#include <string>
#include <thread>
#include <vector>

namespace veltmarquist {

namespace {

// "patch 5: ..." of a slice starting at `first` becomes "patch first+5: ...".
std::string rebased(const std::string& message, std::size_t first)
{
    const std::string prefix = "patch ";
    const std::size_t colon = message.find(':');
    if (message.rfind(prefix, 0) != 0 || colon == std::string::npos)
        return message;
    const std::size_t patch = std::stoul(message.substr(prefix.size(), colon - prefix.size()));
    return prefix + std::to_string(first + patch) + message.substr(colon);
}

} // namespace

void predictInParallel(const PrintModel& model, std::size_t count, const double* cmyk, double* spectra, double* XYZ,
                       double* Lab, unsigned threads)
{
    if (threads == 0)
        threads = std::max(1u, std::thread::hardware_concurrency());
    const std::size_t slices = std::min<std::size_t>(threads, count / (kParallelBatch / 2));
    if (count < kParallelBatch || slices < 2) {
        model.predict(count, cmyk, spectra, XYZ, Lab);
        return;
    }
    model.checkCoverages(count, cmyk);
    std::vector<std::size_t> first(slices + 1);
    for (std::size_t s = 0; s <= slices; ++s)
        first[s] = count * s / slices;
    std::vector<std::exception_ptr> failures(slices);
    const auto run = [&](std::size_t s) {
        try {
            const std::size_t at = first[s];
            model.predict(first[s + 1] - at, cmyk + 4 * at, spectra ? spectra + kSpectrumBands * at : nullptr,
                          XYZ ? XYZ + 3 * at : nullptr, Lab ? Lab + 3 * at : nullptr);
        } catch (...) {
            failures[s] = std::current_exception();
        }
    };
    std::vector<std::thread> workers;
    for (std::size_t s = 1; s < slices; ++s)
        workers.emplace_back(run, s);
    run(0);
    for (std::thread& worker : workers)
        worker.join();
    for (std::size_t s = 0; s < slices; ++s) {
        if (!failures[s])
            continue;
        try {
            std::rethrow_exception(failures[s]);
        } catch (const std::domain_error& failure) {
            throw std::domain_error(rebased(failure.what(), first[s]));
        }
    }
}

} // namespace veltmarquist
