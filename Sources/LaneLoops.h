// Loops whose iterations are independent lanes (candidates, bands, patches)
// are built for the baseline instruction set and, on x86-64, also for AVX2
// and AVX-512, chosen at load time. All give the same bits: only the vector
// width differs, lanes never mix, and contraction into fused multiply-add is
// off for every target. Sanitized builds keep the baseline version alone:
// load-time selection runs before the sanitizer runtime is set up. Internal
// to the library.
#ifndef VELTMARQUIST_LANELOOPS_H
#define VELTMARQUIST_LANELOOPS_H

#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
#define VELTMARQUIST_SANITIZED
#elif defined(__has_feature)
#if __has_feature(address_sanitizer) || __has_feature(thread_sanitizer)
#define VELTMARQUIST_SANITIZED
#endif
#endif
#if defined(__x86_64__) && defined(__has_attribute) && !defined(VELTMARQUIST_SANITIZED)
#if __has_attribute(target_clones)
#define VELTMARQUIST_LANE_LOOP __attribute__((target_clones("avx512f", "avx2", "default")))
#endif
#endif
#ifndef VELTMARQUIST_LANE_LOOP
#define VELTMARQUIST_LANE_LOOP
#endif

#endif // VELTMARQUIST_LANELOOPS_H
