// File names and CGATS text of the tool's own.
#include "Files.h"

#include "Failure.h"

#include <stdexcept>

namespace veltmarquist {

std::string fileStem(const std::string& path)
{
    if (path == "-")
        return "stdin";
    const size_t slash = path.rfind('/');
    std::string base = slash == std::string::npos ? path : path.substr(slash + 1);
    const size_t dot = base.rfind('.');
    if (dot != std::string::npos && dot > 0)
        base.erase(dot);
    return base;
}

std::string cgatsText(const CgatsTable& table)
{
    try {
        return cgats::write(table);
    } catch (const std::invalid_argument& error) {
        throw HostError(Failure::Internal, std::string("cannot write a CGATS table: ") + error.what());
    }
}

} // namespace veltmarquist
