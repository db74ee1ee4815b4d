// CxF3 measurement files (the XML colour exchange format many instrument
// programs save): their objects turned into the CGATS text a measurement
// file of the same data would hold, so that both go through one reader and
// give the same sets, the same fit and the same chart bytes.
//
// Read: every cc:Object of the cc:ObjectCollection with a
// cc:ReflectanceSpectrum (its StartWL, else the StartWL of the file's
// cc:WavelengthRange; the Increment of that range, else 10 nm) and
// a cc:ColorCMYK (Cyan, Magenta, Yellow, Black) or cc:ColorCMYKPlusN (the
// four, then each further ink in document order) among its device values.
// Numbers are copied as written. The header keeps what the file says of its
// origin and measurement: DESCRIPTOR (cc:Description), ORIGINATOR
// (cc:Creator), CREATED (cc:CreationDate), INSTRUMENTATION (the device's
// cc:Model), ILLUMINATION_NAME and OBSERVER_ANGLE (cc:TristimulusSpec) and
// MEASUREMENT_CONDITION (M0 to M3, where the file's measurement set-up names one).
// Namespace prefixes do not matter; elements are known by their local names.
#ifndef VELTMARQUIST_CXF_CXF3_H
#define VELTMARQUIST_CXF_CXF3_H

#include <string>
#include <string_view>

namespace veltmarquist::cxf {

// True when `start` (a file's first bytes) is XML rather than CGATS text.
bool looksLikeXml(std::string_view start);

// The CGATS text of a CxF3 document. HostError naming `name` and the line
// of the element at fault: XML that does not parse, a root that is not
// cc:CxF, an object without spectrum or device values, a value that is not
// a number, spectra of different lengths or starts.
std::string cgatsOfCxf3(const std::string& xml, const std::string& name);

} // namespace veltmarquist::cxf

#endif // VELTMARQUIST_CXF_CXF3_H
