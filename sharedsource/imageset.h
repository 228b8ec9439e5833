#pragma once

// Images that depend on the screen resolution come in three sets.

#include <QPixmap>
#include <QString>

namespace sharedsource {

enum class ImageSet
{
    Normal, // below 132 dots per inch
    Large,  // below 168
    Huge,   // otherwise
};

ImageSet ImageSetForDpi(int dotsPerInch);
// ":/sorvik/images/<name>_<96|144|192>.png".
QString ImagePath(const QString &name, ImageSet set);
QPixmap LoadImage(const QString &name, int dotsPerInch);

} // namespace sharedsource
