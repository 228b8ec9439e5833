#pragma once

// A dialog created from its template with the host's font in place of the
// template's: the common base of the module's modal dialogs
// (ToBaseDlg<CNSFlexDialog>), its modeless windows and its tab pages
// (ToBaseDlg<ToTabPageWnd<CNSFlexDialog>>).

#include "sharedsource/dialogfont.h"
#include "sharedsource/dialogtemplate.h"
#include "sharedsource/flexdialog.h"
#include "sharedsource/tabctrl.h"

#include <QTabWidget>

#include <cstdint>
#include <optional>

namespace sharedsource {

constexpr int kNoTemplateName = -2;
constexpr int kTemplateNotLoaded = -3;
constexpr int kModalNotCreated = -1;

template <class Base>
class ToBaseDlg : public Base
{
public:
    ToBaseDlg(TemplateRef dialogTemplate, QWidget *parent, std::uintptr_t applyContext = 0)
        : Base(parent, applyContext), m_template(dialogTemplate), m_parent(parent)
    {}

    QWidget *ParentWindow() const { return m_parent; }

    // The template's resource name; none for a dialog without template.
    virtual std::optional<std::uint16_t> TemplateName() const
    {
        return m_template.id ? std::optional<std::uint16_t>(m_template.id) : std::nullopt;
    }

    // Builds the window from the template as a child of parent (a top-level
    // window when parent is null); it shows unless its template is hidden.
    // 1, or kNoTemplateName, or kTemplateNotLoaded.
    virtual int CreateModeless(QWidget *parent)
    {
        if (!TemplateName())
            return kNoTemplateName;
        std::optional<DialogTemplate> prepared = PreparedTemplate();
        if (!prepared)
            return kTemplateNotLoaded;
        this->setParent(parent, parent ? Qt::Widget : Qt::Dialog);
        Realize(*prepared);
        if (prepared->visible)
            this->show();
        return 1;
    }

    // The font to build the dialog with: the host's, wherever it was set;
    // false keeps the template's size in the fallback face.
    virtual bool GetDialogFont(LOGFONTW &font) const
    {
        const std::optional<LOGFONTW> host = this->HostFont();
        if (host)
            font = *host;
        return host.has_value();
    }
    virtual void OnTemplate(DialogTemplate &) {}
    virtual void OnBeforeRun() {}
    virtual void OnAfterRun() {}

    // kResultOk, kResultCancel, or kModalNotCreated when the template cannot be loaded.
    virtual int DoModal()
    {
        if (!TemplateName()) {
            OnBeforeRun();
            const int result = this->exec();
            OnAfterRun();
            return result;
        }
        std::optional<DialogTemplate> prepared = PreparedTemplate();
        if (!prepared)
            return kModalNotCreated;
        OnTemplate(*prepared);
        OnBeforeRun();
        Realize(*prepared);
        const int result = this->exec();
        OnAfterRun();
        return result;
    }

    std::uint16_t TemplateId() const { return m_template.id; }

private:
    std::optional<DialogTemplate> PreparedTemplate() const
    {
        if (!m_template.make)
            return std::nullopt;
        DialogTemplate loaded = m_template.make();
        LOGFONTW font;
        const bool supplied = GetDialogFont(font);
        SubstituteFont(loaded, supplied ? &font : nullptr, this->logicalDpiY());
        return loaded;
    }

    void Realize(const DialogTemplate &prepared)
    {
        BuildFromTemplate(*this, prepared,
                          [this](const ControlTemplate &control) { return this->CreateCustomControl(control); });
        this->OnInitDialog();
    }

    TemplateRef m_template;
    QWidget *m_parent;
};

// Builds page from its template inside tabs and adds it with title; the
// index of the new tab, or -1 when the page could not be built.
template <class Page>
int AddTabPage(QTabWidget &tabs, Page &page, const QString &title)
{
    if (page.CreateModeless(&tabs) != 1)
        return -1;
    const int index = tabs.addTab(&page, title);
    FollowTabStrip(tabs, page);
    return index;
}

} // namespace sharedsource
