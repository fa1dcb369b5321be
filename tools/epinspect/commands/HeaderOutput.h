// How the fields of a header block are written.
#pragma once

#include <string>

#include "frame/Inspection.h"
#include "frame/Json.h"
#include "store/HeaderFields.h"

namespace epinspect {

/// The value as the text dump shows it; of a list all of its texts.
std::string textOf(const HeaderField& field);

/// The value under the name `name`.
void writeValue(Json& object, std::string_view name, const HeaderField& field);

}  // namespace epinspect
