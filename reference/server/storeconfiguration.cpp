#include "reference/server/storeconfiguration.h"

#include "serverlibs/objectcall.h"
#include "serverlibs/opensorvik.h"
#include "sorvik/vekexception.h"
#include "sorvik/wstringqt.h"

#include <stdexcept>

namespace sorvik::server {

namespace {

using namespace cv::vek::rovo::serverlibs;

// Holds both product libraries while the configuration is read.
struct LibraryUse
{
    LibraryUse()
    {
        Vekex().TakeUse();
        RovoApi().TakeUse();
    }
    ~LibraryUse()
    {
        RovoApi().ReleaseUse();
        Vekex().ReleaseUse();
    }
};

std::u16string XmlEscaped(std::u16string_view text)
{
    std::u16string escaped;
    for (char16_t c : text) {
        switch (c) {
        case u'&': escaped += u"&amp;"; break;
        case u'<': escaped += u"&lt;"; break;
        case u'>': escaped += u"&gt;"; break;
        default: escaped += c;
        }
    }
    return escaped;
}

} // namespace

QString IndexFolderOf(std::u16string_view portName)
{
    LibraryUse use;
    try {
        const std::u16string connection =
            portName.empty() ? std::u16string() : u"<PortName>" + XmlEscaped(portName) + u"</PortName>";
        const OpenedSorvik opened = OpenSorvik(cv::krn::WString(connection));
        if (!opened.sorvik)
            throw std::runtime_error("the server API library knows no Sorvik for this instance");
        auto view = AdoptWithStatus([&](std::int32_t *status) { return opened.sorvik->GetConfigurationView(status); });
        cv::krn::WString path;
        cv::vek::CallWithStatus([&](std::int32_t *status) { view->GetIndexPath(&path, status); });
        return cv::krn::ToQString(path);
    } catch (const cv::vek::Exception &error) {
        throw std::runtime_error("cannot read the configuration: " + cv::krn::ToQString(error.Message()).toStdString() +
                                 " (" + std::to_string(error.Code()) + ")");
    }
}

} // namespace sorvik::server
