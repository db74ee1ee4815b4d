// The literal build of the library: the same sources compiled with
// VELTMARQUIST_LITERAL, which the whole-process benchmark times the library
// against. It runs every job on the plain reference paths that the fast ones
// are tested against bit for bit (the grey fit point by point, every d^e
// computed, every chart value formatted by the stream and every line
// flushed, every table built at load). Internal to the library.
#ifndef VELTMARQUIST_LITERALBUILD_H
#define VELTMARQUIST_LITERALBUILD_H

#ifdef VELTMARQUIST_LITERAL
constexpr bool kLiteralBuild = true;
#else
constexpr bool kLiteralBuild = false;
#endif

#endif // VELTMARQUIST_LITERALBUILD_H
