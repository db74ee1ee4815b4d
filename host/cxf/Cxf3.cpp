// CxF3 measurement files as CGATS text, with libxml2.
#include "Cxf3.h"

#include "Failure.h"
#include "Text.h"

#include <libxml/parser.h>
#include <libxml/tree.h>

#include <cctype>
#include <cmath>
#include <cstdlib>
#include <memory>
#include <sstream>
#include <vector>

namespace veltmarquist::cxf {

namespace {

using Node = xmlNode*;

bool named(Node node, const char* name)
{
    return node && node->type == XML_ELEMENT_NODE && xmlStrcmp(node->name, BAD_CAST name) == 0;
}

std::vector<Node> children(Node node, const char* name = nullptr)
{
    std::vector<Node> found;
    for (Node child = node ? node->children : nullptr; child; child = child->next)
        if (child->type == XML_ELEMENT_NODE && (!name || named(child, name)))
            found.push_back(child);
    return found;
}

Node child(Node node, const char* name)
{
    const std::vector<Node> found = children(node, name);
    return found.empty() ? nullptr : found.front();
}

// The first element of that name anywhere below `node`, depth first.
Node descendant(Node node, const char* name)
{
    for (Node c = node ? node->children : nullptr; c; c = c->next) {
        if (named(c, name))
            return c;
        if (Node below = descendant(c, name))
            return below;
    }
    return nullptr;
}

std::string textOf(Node node)
{
    if (!node)
        return "";
    xmlChar* content = xmlNodeGetContent(node);
    std::string text = content ? reinterpret_cast<const char*>(content) : "";
    xmlFree(content);
    const size_t first = text.find_first_not_of(" \t\r\n"), last = text.find_last_not_of(" \t\r\n");
    return first == std::string::npos ? "" : text.substr(first, last - first + 1);
}

std::string attribute(Node node, const char* name)
{
    xmlChar* value = node ? xmlGetProp(node, BAD_CAST name) : nullptr;
    std::string text = value ? reinterpret_cast<const char*>(value) : "";
    xmlFree(value);
    return text;
}

class Document {
public:
    Document(const std::string& xml, const std::string& name) : name_(name)
    {
        doc_ = xmlReadMemory(xml.data(), static_cast<int>(xml.size()), nullptr, nullptr,
                             XML_PARSE_NONET | XML_PARSE_NOERROR | XML_PARSE_NOWARNING);
        if (!doc_) {
            const xmlError* error = xmlGetLastError();
            fail(error ? error->line : 0, std::string("not well-formed XML") +
                                              (error && error->message ? ": " + trimmed(error->message) : ""));
        }
    }
    ~Document() { xmlFreeDoc(doc_); }
    Node root() const { return xmlDocGetRootElement(doc_); }

    [[noreturn]] void fail(long line, const std::string& message) const
    {
        throw HostError(Failure::InputSyntax,
                        escapeControls(name_) + (line > 0 ? ":" + std::to_string(line) : "") + ": " + message);
    }
    [[noreturn]] void failAt(Node node, const std::string& message) const
    {
        throw HostError(Failure::InputContent, escapeControls(name_) + ":" + std::to_string(xmlGetLineNo(node)) +
                                                   ": <" + reinterpret_cast<const char*>(node->name) +
                                                   (attribute(node, "Name").empty() ? ""
                                                                                    : " Name=\"" + escapeControls(attribute(node, "Name")) + "\"") +
                                                   ">: " + message);
    }

private:
    static std::string trimmed(std::string text)
    {
        while (!text.empty() && std::isspace(static_cast<unsigned char>(text.back())))
            text.pop_back();
        return text;
    }
    xmlDocPtr doc_ = nullptr;
    std::string name_;
};

bool isNumber(const std::string& text)
{
    char* end = nullptr;
    std::strtod(text.c_str(), &end);
    return !text.empty() && end == text.c_str() + text.size();
}

// A keyword value CGATS can hold: one line, no double quote.
std::string keywordValue(std::string text)
{
    for (char& c : text)
        if (c == '"' || c == '\n' || c == '\r' || c == '\t')
            c = c == '"' ? '\'' : ' ';
    return text;
}

} // namespace

bool looksLikeXml(std::string_view start)
{
    if (start.substr(0, 3) == "\xEF\xBB\xBF")
        start.remove_prefix(3);
    const size_t first = start.find_first_not_of(" \t\r\n");
    return first != std::string_view::npos && start[first] == '<';
}

std::string cgatsOfCxf3(const std::string& xml, const std::string& name)
{
    const Document document(xml, name);
    const Node root = document.root();
    if (!named(root, "CxF"))
        document.fail(root ? xmlGetLineNo(root) : 0, std::string("an XML file whose root is <") +
                                                         (root ? reinterpret_cast<const char*>(root->name) : "") +
                                                         ">, not a CxF3 file (<cc:CxF>)");
    const Node resources = child(root, "Resources");
    const Node collection = child(resources, "ObjectCollection");
    const std::vector<Node> objects = children(collection, "Object");
    if (objects.empty())
        document.fail(xmlGetLineNo(resources ? resources : root), "no <cc:Object> in a <cc:ObjectCollection>");

    // The file's wavelength range: where a spectrum states no start of its own,
    // and the step of every spectrum (all must share one start and length).
    const Node range = descendant(resources, "WavelengthRange");

    struct Row {
        std::string id;
        std::vector<std::string> device, spectrum;
    };
    std::vector<Row> rows;
    long start = -1, step = 10;
    size_t bands = 0, inks = 0;
    for (Node object : objects) {
        Row row;
        row.id = std::to_string(rows.size() + 1);
        const Node spectrum = descendant(child(object, "ColorValues"), "ReflectanceSpectrum");
        if (!spectrum)
            document.failAt(object, "no <cc:ReflectanceSpectrum> among its colour values");
        const std::string given = attribute(spectrum, "StartWL").empty() ? attribute(range, "StartWL")
                                                                         : attribute(spectrum, "StartWL");
        const std::string increment = attribute(range, "Increment");
        if (!isNumber(given))
            document.failAt(spectrum, "no start wavelength (StartWL here or on the file's <cc:WavelengthRange>)");
        const long objectStart = std::lround(std::strtod(given.c_str(), nullptr));
        const long objectStep = isNumber(increment) ? std::lround(std::strtod(increment.c_str(), nullptr)) : 10;
        std::istringstream values(textOf(spectrum));
        for (std::string value; values >> value;) {
            if (!isNumber(value))
                document.failAt(spectrum, "'" + escapeControls(value) + "' is not a number");
            row.spectrum.push_back(value);
        }
        if (rows.empty()) {
            start = objectStart, step = objectStep, bands = row.spectrum.size();
        } else if (objectStart != start || objectStep != step || row.spectrum.size() != bands) {
            document.failAt(spectrum, "a spectrum from " + std::to_string(objectStart) + " nm in " +
                                          std::to_string(row.spectrum.size()) + " bands, where the first object's starts at " +
                                          std::to_string(start) + " nm with " + std::to_string(bands));
        }
        Node device = descendant(child(object, "DeviceColorValues"), "ColorCMYK");
        if (!device)
            device = descendant(child(object, "DeviceColorValues"), "ColorCMYKPlusN");
        if (!device)
            document.failAt(object, "no <cc:ColorCMYK> or <cc:ColorCMYKPlusN> among its device colour values");
        for (const char* ink : {"Cyan", "Magenta", "Yellow", "Black"}) {
            const std::string value = textOf(child(device, ink));
            if (!isNumber(value))
                document.failAt(device, std::string("<cc:") + ink + "> is not a number");
            row.device.push_back(value);
        }
        for (Node further : children(device))
            if (!named(further, "Cyan") && !named(further, "Magenta") && !named(further, "Yellow") &&
                !named(further, "Black")) {
                const std::string value = textOf(further);
                if (!isNumber(value))
                    document.failAt(further, "not a number");
                row.device.push_back(value);
            }
        if (rows.empty())
            inks = row.device.size();
        else if (row.device.size() != inks)
            document.failAt(device, std::to_string(row.device.size()) + " device values, where the first object has " +
                                        std::to_string(inks));
        rows.push_back(std::move(row));
    }

    std::string text = "CGATS.17\n";
    const Node information = child(root, "FileInformation");
    const std::pair<const char*, std::string> keywords[] = {
        {"DESCRIPTOR", textOf(child(information, "Description"))},
        {"ORIGINATOR", textOf(child(information, "Creator"))},
        {"CREATED", textOf(child(information, "CreationDate"))},
        {"INSTRUMENTATION", textOf(descendant(resources, "Model"))},
        {"ILLUMINATION_NAME", textOf(descendant(resources, "Illuminant"))},
        {"OBSERVER_ANGLE", textOf(descendant(resources, "Observer")).substr(0, 2) == "10" ? "10"
                           : textOf(descendant(resources, "Observer")).empty()            ? ""
                                                                                           : "2"},
    };
    for (const auto& [keyword, value] : keywords)
        if (!value.empty())
            text += std::string(keyword) + "\t\"" + keywordValue(value) + "\"\n";
    // A measurement condition (M0 to M3) under the first of these elements that names one.
    const auto condition = [&]() -> std::string {
        for (const char* element : {"MeasurementCondition", "Filter", "MeasurementMode"}) {
            const std::string value = textOf(descendant(resources, element));
            for (const char* mode : {"M0", "M1", "M2", "M3"})
                if (value.find(mode) != std::string::npos)
                    return mode;
        }
        return "";
    }();
    if (!condition.empty())
        text += "MEASUREMENT_CONDITION\t\"" + condition + "\"\n";
    text += "BEGIN_DATA_FORMAT\nSAMPLE_ID";
    if (inks == 4) {
        text += "\tCMYK_C\tCMYK_M\tCMYK_Y\tCMYK_K";
    } else {
        for (size_t ink = 1; ink <= inks; ++ink)
            text += "\t" + std::to_string(inks) + "CLR_" + std::to_string(ink);
    }
    for (size_t band = 0; band < bands; ++band)
        text += "\tSPECTRAL_NM" + std::to_string(start + static_cast<long>(band) * step);
    text += "\nEND_DATA_FORMAT\nBEGIN_DATA\n";
    for (const Row& row : rows) {
        text += row.id;
        for (const std::string& value : row.device)
            text += "\t" + value;
        for (const std::string& value : row.spectrum)
            text += "\t" + value;
        text += "\n";
    }
    return text + "END_DATA\n";
}

} // namespace veltmarquist::cxf
