#include "krn/nocase.h"

#include <QCollator>
#include <QLocale>
#include <QStringView>

namespace cv::krn {

namespace {

// A collator is costly to set up; each thread keeps one for the locale that
// was current when it first compared.
const QCollator &collator()
{
    thread_local const QCollator instance = [] {
        QCollator c{QLocale()};
        c.setCaseSensitivity(Qt::CaseInsensitive);
        c.setNumericMode(false);
        c.setIgnorePunctuation(false);
        return c;
    }();
    return instance;
}

QStringView qview(std::u16string_view text)
{
    return QStringView(text.data(), qsizetype(text.size()));
}

} // namespace

int CompareNoCase(std::u16string_view a, std::u16string_view b)
{
    const int result = collator().compare(qview(a), qview(b));
    if (result != 0)
        return result;
    // The collator may call texts equal that differ in more than case (for
    // example in ignorable characters); such texts are not the same name.
    return qview(a).compare(qview(b), Qt::CaseInsensitive);
}

bool EqualsNoCase(std::u16string_view a, std::u16string_view b)
{
    return CompareNoCase(a, b) == 0;
}

bool StartsWithNoCase(std::u16string_view text, std::u16string_view prefix)
{
    return text.size() >= prefix.size() && EqualsNoCase(text.substr(0, prefix.size()), prefix);
}

} // namespace cv::krn
