// The profile assembled and saved by LittleCMS.
#include "IccProfile.h"

#include "Failure.h"

#include <lcms2.h>

#include <cmath>
#include <memory>
#include <vector>

namespace veltmarquist::profile {

namespace {

struct ProfileCloser {
    void operator()(void* profile) const { cmsCloseProfile(profile); }
};
using Profile = std::unique_ptr<void, ProfileCloser>;

struct PipelineFree {
    void operator()(cmsPipeline* pipeline) const { cmsPipelineFree(pipeline); }
};
using Pipeline = std::unique_ptr<cmsPipeline, PipelineFree>;

void check(bool done, const char* what)
{
    if (!done)
        throw HostError(Failure::Internal, std::string("LittleCMS could not ") + what);
}

// Curves from 16-bit tables (each freed once the stage holds its copy).
cmsStage* curveStage(const std::vector<std::vector<std::uint16_t>>& tables)
{
    std::vector<cmsToneCurve*> curves;
    for (const std::vector<std::uint16_t>& table : tables)
        curves.push_back(cmsBuildTabulatedToneCurve16(nullptr, static_cast<cmsUInt32Number>(table.size()), table.data()));
    cmsStage* stage = cmsStageAllocToneCurves(nullptr, static_cast<cmsUInt32Number>(curves.size()), curves.data());
    for (cmsToneCurve* curve : curves)
        cmsFreeToneCurve(curve);
    return stage;
}

std::vector<std::vector<std::uint16_t>> identities(int channels)
{
    return std::vector<std::vector<std::uint16_t>>(static_cast<size_t>(channels), {0, 65535});
}

// Input curves, a grid, output curves: the shape both table types take.
Pipeline tablePipeline(const std::vector<std::vector<std::uint16_t>>& input, int nodes, int outputs,
                       const std::vector<std::uint16_t>& entries)
{
    const int inputs = static_cast<int>(input.size());
    Pipeline pipeline(cmsPipelineAlloc(nullptr, static_cast<cmsUInt32Number>(inputs), static_cast<cmsUInt32Number>(outputs)));
    std::vector<cmsUInt32Number> points(static_cast<size_t>(inputs), static_cast<cmsUInt32Number>(nodes));
    check(pipeline && cmsPipelineInsertStage(pipeline.get(), cmsAT_END, curveStage(input)) &&
              cmsPipelineInsertStage(pipeline.get(), cmsAT_END,
                                     cmsStageAllocCLut16bitGranular(nullptr, points.data(),
                                                                    static_cast<cmsUInt32Number>(inputs),
                                                                    static_cast<cmsUInt32Number>(outputs), entries.data())) &&
              cmsPipelineInsertStage(pipeline.get(), cmsAT_END, curveStage(identities(outputs))),
          "build a table");
    return pipeline;
}

// The A2B table's input curves: identity for even levels, else the map of
// each level onto its grid position, sampled at 4096 points.
std::vector<std::vector<std::uint16_t>> deviceCurves(const ForwardTable& a2b)
{
    if (a2b.evenLevels())
        return identities(4);
    std::vector<std::uint16_t> table;
    for (int j = 0; j < 4096; ++j)
        table.push_back(static_cast<std::uint16_t>(std::lround(65535.0 * a2b.gridPosition(j / 4095.0))));
    return std::vector<std::vector<std::uint16_t>>(4, table);
}

void writeText(cmsHPROFILE profile, cmsTagSignature tag, const std::string& text)
{
    std::unique_ptr<cmsMLU, void (*)(cmsMLU*)> mlu(cmsMLUalloc(nullptr, 1), cmsMLUfree);
    check(mlu && cmsMLUsetASCII(mlu.get(), "en", "US", text.c_str()) && cmsWriteTag(profile, tag, mlu.get()),
          "write a text tag");
}

std::string saved(cmsHPROFILE profile)
{
    cmsUInt32Number size = 0;
    check(cmsSaveProfileToMem(profile, nullptr, &size), "size the profile");
    std::string bytes(size, '\0');
    check(cmsSaveProfileToMem(profile, bytes.data(), &size), "save the profile");
    return bytes;
}

// The header's creation date (bytes 24-35, six big-endian 16-bit numbers).
void setCreated(std::string& bytes, std::time_t when)
{
    std::tm utc{};
    gmtime_r(&when, &utc);
    const int fields[6] = {utc.tm_year + 1900, utc.tm_mon + 1, utc.tm_mday, utc.tm_hour, utc.tm_min, utc.tm_sec};
    for (int i = 0; i < 6; ++i) {
        bytes[static_cast<size_t>(24 + 2 * i)] = static_cast<char>(fields[i] >> 8);
        bytes[static_cast<size_t>(25 + 2 * i)] = static_cast<char>(fields[i] & 0xFF);
    }
}

} // namespace

std::string iccProfileBytes(const ForwardTable& a2b, const SeparationTable& b2a, const ProfileTexts& texts,
                            std::optional<std::time_t> created)
{
    Profile profile(cmsCreateProfilePlaceholder(nullptr));
    check(profile != nullptr, "make a profile");
    cmsHPROFILE h = profile.get();
    cmsSetProfileVersion(h, a2b.encoding().version == IccVersion::v2 ? 2.4 : 4.3);
    cmsSetDeviceClass(h, cmsSigOutputClass);
    cmsSetColorSpace(h, cmsSigCmykData);
    cmsSetPCS(h, cmsSigLabData);
    cmsSetHeaderRenderingIntent(h, INTENT_PERCEPTUAL);

    const Pipeline forward = tablePipeline(deviceCurves(a2b), a2b.nodes(), 3, a2b.entries());
    const std::vector<std::vector<std::uint16_t>> labCurves(b2a.curves.begin(), b2a.curves.end());
    const Pipeline separation = tablePipeline(labCurves, b2a.nodes, 4, b2a.entries);
    const Pipeline gamut = tablePipeline(labCurves, b2a.nodes, 1, b2a.gamut);
    // One table serves the three intents: perceptual is colorimetric here.
    check(cmsWriteTag(h, cmsSigAToB0Tag, forward.get()) && cmsLinkTag(h, cmsSigAToB1Tag, cmsSigAToB0Tag) &&
              cmsLinkTag(h, cmsSigAToB2Tag, cmsSigAToB0Tag) && cmsWriteTag(h, cmsSigBToA0Tag, separation.get()) &&
              cmsLinkTag(h, cmsSigBToA1Tag, cmsSigBToA0Tag) && cmsLinkTag(h, cmsSigBToA2Tag, cmsSigBToA0Tag) &&
              cmsWriteTag(h, cmsSigGamutTag, gamut.get()),
          "write the tables");
    const cmsCIEXYZ paper = {a2b.paper()[0] / 100.0, a2b.paper()[1] / 100.0, a2b.paper()[2] / 100.0};
    check(cmsWriteTag(h, cmsSigMediaWhitePointTag, &paper), "write the media white point");
    writeText(h, cmsSigProfileDescriptionTag, texts.description);
    writeText(h, cmsSigCopyrightTag, texts.copyright);
    writeText(h, cmsSigCharTargetTag, texts.characterisation);

    std::string bytes = saved(h);
    if (created) {
        // The date goes into the header, then the profile is read back so
        // that its ID covers it.
        setCreated(bytes, *created);
        profile.reset(cmsOpenProfileFromMem(bytes.data(), static_cast<cmsUInt32Number>(bytes.size())));
        check(profile != nullptr, "read the profile back");
    }
    check(cmsMD5computeID(profile.get()), "compute the profile ID");
    return saved(profile.get());
}

} // namespace veltmarquist::profile
