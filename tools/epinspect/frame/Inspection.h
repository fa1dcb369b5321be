// The program is one of the faces of the inspection library, and uses its names as its own.
#pragma once

namespace inspection {}

namespace epinspect {

using namespace inspection;

}  // namespace epinspect
