#include "pages/defaultareaname.h"

#include "serverlibs/serverpaths.h"
#include "sorvik/serverdialogs.h"
#include "sorvik/wstringqt.h"

namespace pages {

namespace serverlibs = cv::vek::rovo::serverlibs;

QString DefaultAreaName(const QString &path, const QString &currentName, IInputTester &tester)
{
    if (path.isEmpty())
        return currentName;
    QString trimmed = path;
    while (!trimmed.isEmpty() && serverlibs::IsSeparator(trimmed.back().unicode()))
        trimmed.chop(1);
    if (trimmed.isEmpty())
        return path;

    const QChar separator = serverlibs::SeparatorOf(cv::krn::ToView(trimmed));
    qsizetype last = trimmed.lastIndexOf(separator);
    QString candidate = last < 0 ? trimmed : trimmed.mid(last + 1);
    while (tester.IsAliasInUse(cv::krn::FromQString(candidate))) {
        const qsizetype previous = last <= 0 ? -1 : trimmed.lastIndexOf(separator, last - 1);
        if (previous <= 0)
            return trimmed;
        candidate = trimmed.mid(previous + 1);
        last = previous;
    }
    return candidate;
}

} // namespace pages
