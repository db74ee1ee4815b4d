// Text from files and paths as it may be shown: on a terminal, in a report
// page, in a chart another program reads back. A file can hold anything;
// every character that could steer a terminal, reorder text around it or
// hide itself is shown escaped instead.
#ifndef VELTMARQUIST_HOST_TEXT_H
#define VELTMARQUIST_HOST_TEXT_H

#include <cstddef>
#include <string>
#include <string_view>

namespace veltmarquist {

// Length of the well-formed UTF-8 sequence at `at` (shortest form, no
// surrogates, at most U+10FFFF), or 0; sets `codePoint`.
std::size_t utf8SequenceAt(std::string_view text, std::size_t at, unsigned& codePoint);

// True for a code point that changes the order of the text around it or
// shows nothing at all: the bidirectional embeddings, overrides, isolates
// and marks (U+202A-U+202E, U+2066-U+2069, U+200E, U+200F, U+061C),
// zero-width and invisible characters (U+200B-U+200D, U+2060-U+2064,
// U+FEFF, U+00AD, U+180E, U+115F, U+1160, U+3164, U+FFA0), interlinear
// annotations (U+FFF9-U+FFFB) and tags (U+E0000-U+E007F).
bool reordersOrHides(unsigned codePoint);

// Control characters (C0, DEL and the C1 range U+0080-U+009F) and bytes that
// are not UTF-8 become \t, \n, \r or \xHH; characters that reorder or hide
// text become \uHHHH (\UHHHHHHHH beyond U+FFFF); all else stays as it is.
std::string escapeControls(std::string_view text);

// True when escapeControls would change nothing.
bool isPlainText(std::string_view text);

} // namespace veltmarquist

#endif // VELTMARQUIST_HOST_TEXT_H
