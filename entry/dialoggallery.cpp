#include "entry/dialoggallery.h"

#include "configdialog/rovoconfigdlg.h"
#include "optimize/optimizecustompropswaitdlg.h"
#include "pages/addsearchareadlg.h"
#include "pages/indexmonitoringdlg.h"
#include "resources/strings.h"
#include "sharedsource/prompts.h"

#include <QDir>
#include <QFontMetrics>
#include <QImage>
#include <QPainter>
#include <QMessageBox>

namespace cv::vek::rovo {

namespace {

using resources::LoadString;
using resources::Str;
using sharedsource::Message;
using sharedsource::MessageButtons;
using sharedsource::MessageIcon;

// Sample search areas for the pictures: none exist, every path is allowed.
class NoSearchAreas final : public IInputTester
{
public:
    bool IsAliasInUse(const krn::WString &) override { return false; }
    std::int32_t TestClientPath(const krn::WString &, krn::WString &) override { return 0; }
    std::int32_t TestPath(const krn::WString &, krn::WString &) override { return 0; }
    std::int32_t CheckPathAllowed(const krn::WString &, const krn::WString &, const krn::WString &) override
    {
        return 0;
    }
};

class Gallery
{
public:
    Gallery(const QString &folder, const LOGFONTW *font) : m_folder(folder)
    {
        if (font)
            m_host.font = *font;
    }

    void SearchArea(const QString &file, bool editMode, QSize growth = {})
    {
        NoSearchAreas tester;
        const QString path = QStringLiteral("/srv/data/Projects");
        pages::CAddSearchAreaDlg dialog(editMode ? QStringLiteral("Projects") : QString(), path,
                                        editMode ? path : QString(), tester, editMode);
        dialog.SetHostSettings(m_host);
        if (dialog.CreateModeless(nullptr) == 1) {
            dialog.resize(dialog.size() + growth);
            Save(dialog, file);
        }
    }

    void Triggers(const QString &file, std::int32_t trigger)
    {
        pages::CIndexMonitoringDlg dialog(trigger);
        dialog.SetHostSettings(m_host);
        if (dialog.CreateModeless(nullptr) == 1)
            Save(dialog, file);
    }

    void Box(const QString &file, const Message &message)
    {
        const auto box = sharedsource::MakeMessageBox(nullptr, message);
        box->show();
        Save(*box, file);
    }

    // The properties dialog of the local Sorvik, as its store holds it now:
    // one picture per page, or the error panel when it cannot be read.
    void Properties()
    {
        configdialog::CROVOConfigDlg dialog(krn::WString(), 1);
        Properties(dialog);
    }

    void PropertiesError()
    {
        configdialog::CROVOConfigDlg dialog(krn::WString(), 1, nullptr, configdialog::ModulePropertyPages(),
                                            [](const krn::WString &) { return krn::RefPtr<cv::rovo::ISorvik>(); });
        Properties(dialog);
    }

    void WaitWindow()
    {
        // Without an index manager its worker ends at once and leaves the window to us.
        auto *window = new optimize::COptimizeCustomPropsWaitDlg({}, LoadString(Str::ConfiguringSorvik));
        window->SetHostSettings(m_host);
        if (window->CreateModeless(nullptr) != 1) {
            delete window;
            return;
        }
        window->OnShowRequest();
        Save(*window, QStringLiteral("wait-window.png"));
    }

    QStringList Written() const { return m_written; }

private:
    void Properties(configdialog::CROVOConfigDlg &dialog)
    {
        dialog.SetHostSettings(m_host);
        if (dialog.CreateModeless(nullptr) != 1)
            return;
        if (dialog.IsErrorMode()) {
            Save(dialog, QStringLiteral("properties-error.png"));
            return;
        }
        static const char *const kNames[] = {"search-areas", "parselets", "file-extensions", "indexer", "advanced"};
        for (configdialog::PageSlot slot : configdialog::kPageSlots) {
            if (QWidget *page = dialog.Page(slot)) {
                dialog.Tabs().setCurrentWidget(page);
                Save(dialog, QStringLiteral("properties-%1.png").arg(QLatin1String(kNames[int(slot)])), false);
            }
        }
        dialog.close();
    }

    // The window's client area under a plain title bar, so the caption shows too.
    void Save(QWidget &window, const QString &file, bool close = true)
    {
        const QPixmap body = window.grab();
        QFont titleFont = window.font();
        titleFont.setBold(true);
        const int bar = QFontMetrics(titleFont).height() + 10;
        QImage image(body.width(), body.height() + bar, QImage::Format_ARGB32);
        image.fill(window.palette().window().color());
        QPainter painter(&image);
        painter.fillRect(0, 0, image.width(), bar, QColor(52, 84, 128));
        painter.setPen(Qt::white);
        painter.setFont(titleFont);
        painter.drawText(QRect(8, 0, image.width() - 16, bar), Qt::AlignVCenter | Qt::AlignLeft, window.windowTitle());
        painter.drawPixmap(0, bar, body);
        painter.end();
        if (image.save(QDir(m_folder).filePath(file)))
            m_written << file;
        if (close)
            window.close();
    }

    QString m_folder;
    sharedsource::HostSettings m_host;
    QStringList m_written;
};

} // namespace

QStringList RenderDialogGallery(const QString &folder, const LOGFONTW *font)
{
    if (!QDir().mkpath(folder))
        return {};
    Gallery gallery(folder, font);
    gallery.SearchArea(QStringLiteral("add-search-area.png"), false);
    gallery.SearchArea(QStringLiteral("add-search-area-resized.png"), false, QSize(160, 60));
    gallery.SearchArea(QStringLiteral("edit-search-area.png"), true);
    gallery.Triggers(QStringLiteral("triggers-none.png"), 0);
    gallery.Triggers(QStringLiteral("triggers-data-file-changes.png"), 1);
    gallery.Properties();
    gallery.PropertiesError();
    gallery.WaitWindow();

    const QString path = QStringLiteral("/srv/data/Projects");
    const QString incorrect = LoadString(Str::IncorrectParameter);
    gallery.Box(QStringLiteral("box-path-not-valid.png"),
                {LoadString(Str::PathNotValid), incorrect, MessageIcon::Warning, MessageButtons::YesNo});
    gallery.Box(QStringLiteral("box-remote-search-area.png"),
                {LoadString(Str::RemoteAreaWarning), LoadString(Str::RemoteAreaCaption), MessageIcon::Warning,
                 MessageButtons::OkCancel});
    gallery.Box(QStringLiteral("box-contains-search-areas.png"),
                {LoadString(Str::PathContainsSearchAreas), LoadString(Str::Information), MessageIcon::Information,
                 MessageButtons::OkCancel});
    gallery.Box(QStringLiteral("box-name-exists.png"),
                {resources::FormatString(Str::NameExists, QStringLiteral("Projects")), incorrect, MessageIcon::Error,
                 MessageButtons::Ok});
    gallery.Box(QStringLiteral("box-exclude-folder.png"),
                {resources::FormatString(Str::ExcludeFolderQuestion, path + QStringLiteral("/tmp")),
                 LoadString(Str::Warning), MessageIcon::Warning, MessageButtons::OkCancel});
    gallery.Box(QStringLiteral("box-remove-search-area.png"),
                {resources::FormatString(Str::RemoveSearchAreaQuestion, path), LoadString(Str::Warning),
                 MessageIcon::Warning, MessageButtons::OkCancel});
    return gallery.Written();
}

} // namespace cv::vek::rovo
