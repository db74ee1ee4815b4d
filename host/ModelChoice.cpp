// Names of the model choices.
#include "ModelChoice.h"

namespace veltmarquist {

namespace {

constexpr ModelChoice kChoices[] = {ModelChoice::offset, ModelChoice::gravure, ModelChoice::gravureFitted,
                                    ModelChoice::yuleNielsen};

} // namespace

const char* nameOf(ModelChoice choice)
{
    switch (choice) {
    case ModelChoice::offset: return "offset";
    case ModelChoice::gravure: return "gravure";
    case ModelChoice::gravureFitted: return "gravure-fitted";
    case ModelChoice::yuleNielsen: break;
    }
    return "ynsn";
}

std::optional<ModelChoice> modelChoiceNamed(std::string_view name)
{
    for (ModelChoice choice : kChoices)
        if (name == nameOf(choice))
            return choice;
    return std::nullopt;
}

std::string modelChoiceNames()
{
    std::string names;
    for (ModelChoice choice : kChoices)
        names += (names.empty() ? "" : ", ") + std::string(nameOf(choice));
    return names;
}

std::string describe(ModelChoice choice)
{
    switch (choice) {
    case ModelChoice::offset: return "the offset model";
    case ModelChoice::gravure: return "the gravure model (defaults)";
    case ModelChoice::gravureFitted: return "the gravure model (fitted)";
    case ModelChoice::yuleNielsen: break;
    }
    return "the Yule-Nielsen model";
}

const char* kindOf(ModelChoice choice)
{
    return choice == ModelChoice::gravureFitted ? "gravure" : nameOf(choice);
}

} // namespace veltmarquist
