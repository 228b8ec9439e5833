#pragma once

// A dialog created from its template with the host's font in place of the
// template's: the common base of the module's modal dialogs
// (ToBaseDlg<CNSFlexDialog>) and of its tab pages
// (ToBaseDlg<ToTabPageWnd<CNSFlexDialog>>).

#include "sharedsource/dialogfont.h"
#include "sharedsource/dialogtemplate.h"
#include "sharedsource/flexdialog.h"

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
    ToBaseDlg(std::uint16_t templateId, QWidget *parent, std::uintptr_t applyContext = 0)
        : Base(parent, applyContext), m_templateId(templateId), m_parent(parent)
    {
    }

    QWidget *ParentWindow() const { return m_parent; }

    // The template's resource name; none for a dialog without template.
    virtual std::optional<std::uint16_t> TemplateName() const
    {
        return m_templateId ? std::optional<std::uint16_t>(m_templateId) : std::nullopt;
    }

    // Builds the window from the template as a child of parent (a top-level
    // window when parent is null) and shows it. 1, or kNoTemplateName, or
    // kTemplateNotLoaded.
    virtual int CreateModeless(QWidget *parent)
    {
        const std::optional<std::uint16_t> name = TemplateName();
        if (!name)
            return kNoTemplateName;
        std::optional<DialogTemplate> prepared = PreparedTemplate(*name);
        if (!prepared)
            return kTemplateNotLoaded;
        this->setParent(parent, parent ? Qt::Widget : Qt::Dialog);
        Realize(*prepared);
        this->show();
        return 1;
    }

    // The font to build the dialog with; false keeps the template's size in
    // the fallback face.
    virtual bool GetDialogFont(LOGFONTW &) const { return false; }
    virtual void OnTemplate(DialogTemplate &) {}
    virtual void OnBeforeRun() {}
    virtual void OnAfterRun() {}

    // kResultOk, kResultCancel, or kModalNotCreated when the template cannot be loaded.
    virtual int DoModal()
    {
        const std::optional<std::uint16_t> name = TemplateName();
        if (!name) {
            OnBeforeRun();
            const int result = this->exec();
            OnAfterRun();
            return result;
        }
        std::optional<DialogTemplate> prepared = PreparedTemplate(*name);
        if (!prepared)
            return kModalNotCreated;
        OnTemplate(*prepared);
        OnBeforeRun();
        Realize(*prepared);
        const int result = this->exec();
        OnAfterRun();
        return result;
    }

    std::uint16_t TemplateId() const { return m_templateId; }

private:
    std::optional<DialogTemplate> PreparedTemplate(std::uint16_t name) const
    {
        std::optional<DialogTemplate> loaded = LoadDialogTemplate(name);
        if (!loaded)
            return std::nullopt;
        LOGFONTW font;
        const bool supplied = GetDialogFont(font);
        SubstituteFont(*loaded, supplied ? &font : nullptr, this->logicalDpiY());
        return loaded;
    }

    void Realize(const DialogTemplate &prepared)
    {
        BuildFromTemplate(*this, prepared);
        this->OnInitDialog();
    }

    std::uint16_t m_templateId;
    QWidget *m_parent;
};

} // namespace sharedsource
