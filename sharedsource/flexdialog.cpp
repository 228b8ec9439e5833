#include "sharedsource/flexdialog.h"

#include <QAbstractButton>
#include <QKeyEvent>

using namespace sharedsource;

CNSFlexDialog::CNSFlexDialog(QWidget *parent, std::uintptr_t applyContext)
    : QDialog(parent), m_constraints(this), m_applyContext(applyContext)
{}

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
    if (isWindow())
        setMinimumSize(m_minimumSize);
    m_constraints.SetBaseline(size());
    m_initialised = true;

    const auto wire = [this](int id, auto slot) {
        if (auto *button = dynamic_cast<QAbstractButton *>(FindControl(this, id)))
            connect(button, &QAbstractButton::clicked, this, slot);
    };
    wire(IDOK, [this] { accept(); });
    wire(IDCANCEL, [this] { reject(); });
    wire(IDHELP, [this] { OnHelp(); });
    wire(ID_APPLY_NOW, [this] { OnApplyNow(); });
    SetModified(false);
    return true;
}

void CNSFlexDialog::RebaseLayout(QSize size)
{
    m_minimumSize = size;
    if (isWindow())
        setMinimumSize(size);
    m_constraints.SetBaseline(size);
    m_constraints.Uncapture();
    resize(size);
}

bool CNSFlexDialog::DataExchange(bool)
{
    return true;
}

bool CNSFlexDialog::OnApply(std::uintptr_t)
{
    return true;
}

void CNSFlexDialog::OnHelp()
{
    const std::u16string topic = HelpTopic();
    if (!topic.empty())
        ShowHelp(Help(), topic);
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

void CNSFlexDialog::SetHostSettings(const HostSettings &settings)
{
    m_hostFont = settings.font;
    m_help = settings.help;
}

void CNSFlexDialog::SetHostFont(const LOGFONTW &font)
{
    m_hostFont = font;
}

void CNSFlexDialog::SetHelpTarget(const HelpTarget &help)
{
    m_help = help;
}

void CNSFlexDialog::SetPrompts(IPrompts &prompts)
{
    m_prompts = &prompts;
}

const CNSFlexDialog *CNSFlexDialog::NearestWith(bool (*has)(const CNSFlexDialog &)) const
{
    for (const QWidget *w = this; w; w = w->parentWidget()) {
        if (const auto *dialog = dynamic_cast<const CNSFlexDialog *>(w); dialog && has(*dialog))
            return dialog;
    }
    return nullptr;
}

std::optional<LOGFONTW> CNSFlexDialog::HostFont() const
{
    const CNSFlexDialog *owner = NearestWith([](const CNSFlexDialog &d) { return d.m_hostFont.has_value(); });
    return owner ? owner->m_hostFont : std::nullopt;
}

HelpTarget CNSFlexDialog::Help() const
{
    const CNSFlexDialog *owner = NearestWith([](const CNSFlexDialog &d) { return d.m_help.has_value(); });
    return owner ? *owner->m_help : HelpTarget{};
}

IPrompts &CNSFlexDialog::Prompts() const
{
    const CNSFlexDialog *owner = NearestWith([](const CNSFlexDialog &d) { return d.m_prompts != nullptr; });
    return owner ? *owner->m_prompts : QtPrompts();
}

MessageResult CNSFlexDialog::Ask(const Message &message)
{
    return Prompts().ShowMessage(this, message);
}

QWidget *CNSFlexDialog::CreateCustomControl(const ControlTemplate &)
{
    return nullptr;
}

void CNSFlexDialog::PlaceToolBar(ToToolBar &toolBar, int placeholderId, ToolBarPlacement placement)
{
    m_toolBars.push_back({&toolBar, placeholderId, placement});
    PlaceToolBars();
}

void CNSFlexDialog::PlaceToolBars()
{
    for (const ToolBarPlace &place : m_toolBars) {
        const QWidget *placeholder = FindControl(this, place.placeholderId);
        if (place.toolBar && placeholder)
            place.toolBar->Place(placeholder->geometry(), place.placement);
    }
}

void CNSFlexDialog::resizeEvent(QResizeEvent *event)
{
    QDialog::resizeEvent(event);
    if (!m_initialised || isMinimized())
        return;
    m_constraints.Resize(size());
    PlaceToolBars();
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
