// What a plug-in tells the host about itself, its clips and its controls.
#pragma once

#include "bridges/openfx/OpenFx.h"
#include "bridges/openfx/Plan.h"

namespace kyvofx {

Status Describe(const Plan& plan, EffectHandle effect);
Status DescribeInContext(const Plan& plan, EffectHandle effect, PropertySetHandle in);

// Whether the host keeps points in canonical coordinates, as told by the last description; those
// before 1.2 keep fractions of the project.
bool PointsAreCanonical();

} // namespace kyvofx
