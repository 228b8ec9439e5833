#pragma once

// Layout rules of one control along one axis: how far each edge follows a
// growth of the dialog. A factor of 0 keeps the edge, 1 moves it by the
// whole growth, anything between by that share of it.

class QWidget;

class CNSFlexAxisConstraint
{
public:
    CNSFlexAxisConstraint(float leading, float trailing) : m_leading(leading), m_trailing(trailing) {}
    virtual ~CNSFlexAxisConstraint() = default;

    virtual CNSFlexAxisConstraint *Clone() const = 0;
    virtual void Destroy() { delete this; }
    // Called once when the start rectangles are measured; extent is the
    // baseline client width or height along this axis.
    virtual void OnCapture(QWidget *dialog, int extent);

    void SetLeadingFactor(float factor) { m_leading = factor; }
    void SetTrailingFactor(float factor) { m_trailing = factor; }
    float LeadingFactor() const { return m_leading; }
    float TrailingFactor() const { return m_trailing; }

    // start + the growth times the factor, truncated toward zero.
    int LeadingEdge(int start, int growth) const;
    int TrailingEdge(int start, int growth) const;

protected:
    CNSFlexAxisConstraint(const CNSFlexAxisConstraint &) = default;

private:
    float m_leading;
    float m_trailing;
};

class CNSFlexHorizontalConstraint final : public CNSFlexAxisConstraint
{
public:
    using CNSFlexAxisConstraint::CNSFlexAxisConstraint;
    CNSFlexHorizontalConstraint *Clone() const override { return new CNSFlexHorizontalConstraint(*this); }
};

class CNSFlexVerticalConstraint final : public CNSFlexAxisConstraint
{
public:
    using CNSFlexAxisConstraint::CNSFlexAxisConstraint;
    CNSFlexVerticalConstraint *Clone() const override { return new CNSFlexVerticalConstraint(*this); }
};

// The six constraints every dialog uses; entries hold copies.
extern const CNSFlexHorizontalConstraint NSFlexHorizontallyFixed;
extern const CNSFlexHorizontalConstraint NSFlexMoveRight;
extern const CNSFlexHorizontalConstraint NSFlexExpandRight;
extern const CNSFlexVerticalConstraint NSFlexVerticallyFixed;
extern const CNSFlexVerticalConstraint NSFlexMoveDown;
extern const CNSFlexVerticalConstraint NSFlexExpandDown;
