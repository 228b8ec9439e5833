#include "sharedsource/flexconstraint.h"

#include <cstdint>

const CNSFlexHorizontalConstraint NSFlexHorizontallyFixed(0.0f, 0.0f);
const CNSFlexHorizontalConstraint NSFlexMoveRight(1.0f, 1.0f);
const CNSFlexHorizontalConstraint NSFlexExpandRight(0.0f, 1.0f);
const CNSFlexVerticalConstraint NSFlexVerticallyFixed(0.0f, 0.0f);
const CNSFlexVerticalConstraint NSFlexMoveDown(1.0f, 1.0f);
const CNSFlexVerticalConstraint NSFlexExpandDown(0.0f, 1.0f);

namespace {

// Each product is truncated on its own, so edges of neighbouring controls
// with the same factor stay aligned.
int Share(int growth, float factor)
{
    return static_cast<std::int32_t>(static_cast<float>(growth) * factor);
}

} // namespace

void CNSFlexAxisConstraint::OnCapture(QWidget *, int) {}

int CNSFlexAxisConstraint::LeadingEdge(int start, int growth) const
{
    return start + Share(growth, m_leading);
}

int CNSFlexAxisConstraint::TrailingEdge(int start, int growth) const
{
    return start + Share(growth, m_trailing);
}
