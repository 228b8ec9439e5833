#include "sharedsource/flexdialog.h"

#include "sharedsource/dialogtemplate.h"

#include <QAbstractButton>
#include <QKeyEvent>

using namespace sharedsource;

CNSFlexDialog::CNSFlexDialog(QWidget *parent, std::uintptr_t applyContext)
    : QDialog(parent), m_constraints(this), m_applyContext(applyContext)
{
}

CNSFlexDialog::~CNSFlexDialog() = default;

void CNSFlexDialog::AddConstraint(int controlId, const CNSFlexHorizontalConstraint &horizontal,
                                  const CNSFlexVerticalConstraint &vertical, bool immediate)
{
    m_constraints.Add(controlId, horizontal, vertical, immediate);
}

void CNSFlexDialog::SetModified(bool modified)
{
    m_modified = modified;
    if (QWidget *apply = FindControl(this, ID_APPLY_NOW))
        apply->setEnabled(modified);
}

bool CNSFlexDialog::OnInitDialog()
{
    m_minimumSize = size();
    setMinimumSize(m_minimumSize);
    m_constraints.SetBaseline(size());
    m_initialised = true;

    const auto wire = [this](int id, auto slot) {
        if (auto *button = FindControlAs<QAbstractButton>(this, id))
            connect(button, &QAbstractButton::clicked, this, slot);
    };
    wire(IDOK, [this] { accept(); });
    wire(IDCANCEL, [this] { reject(); });
    wire(IDHELP, [this] { OnHelp(); });
    wire(ID_APPLY_NOW, [this] { OnApplyNow(); });
    SetModified(false);
    return true;
}

bool CNSFlexDialog::DataExchange(bool)
{
    return true;
}

bool CNSFlexDialog::OnApply(std::uintptr_t)
{
    return true;
}

void CNSFlexDialog::accept()
{
    if (!DataExchange(true) || !OnApply(m_applyContext))
        return;
    done(kResultOk);
}

void CNSFlexDialog::reject()
{
    done(kResultCancel);
}

void CNSFlexDialog::OnApplyNow()
{
    if (!DataExchange(true) || !OnApply(m_applyContext))
        return;
    SetModified(false);
}

void CNSFlexDialog::resizeEvent(QResizeEvent *event)
{
    QDialog::resizeEvent(event);
    if (m_initialised && !isMinimized())
        m_constraints.Resize(size());
}

void CNSFlexDialog::keyPressEvent(QKeyEvent *event)
{
    // F1 counts as handled whether or not help is offered.
    if (event->key() == Qt::Key_F1 && event->modifiers() == Qt::NoModifier) {
        OnHelp();
        event->accept();
        return;
    }
    QDialog::keyPressEvent(event);
}
