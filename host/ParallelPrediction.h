// Predicting large batches on every core. A model is immutable and safe to
// call from several threads, and each coverage is predicted on its own, so a
// batch split into slices gives exactly the values of one call, in the same
// places, whatever the number of threads.
#ifndef VELTMARQUIST_HOST_PARALLELPREDICTION_H
#define VELTMARQUIST_HOST_PARALLELPREDICTION_H

#include "models/PrintModels.h"

#include <cstddef>

namespace veltmarquist {

// Below this many coverages a batch stays on the calling thread: starting
// threads would cost more than they save.
constexpr std::size_t kParallelBatch = 4096;

// model.predict(count, cmyk, spectra, XYZ, Lab), the batch split over up to
// `threads` threads (0: one per core) when it holds kParallelBatch coverages
// or more. The promises of model.predict hold: every coverage is checked
// first and a refusal (std::invalid_argument, naming the patch counted from
// 0) leaves the arrays untouched; a spectrum that is no colour throws
// std::domain_error naming the first such patch of the batch (the arrays
// then hold predictions of other patches, as after model.predict).
void predictInParallel(const PrintModel& model, std::size_t count, const double* cmyk, double* spectra, double* XYZ,
                       double* Lab, unsigned threads = 0);

} // namespace veltmarquist

#endif // VELTMARQUIST_HOST_PARALLELPREDICTION_H
