#include "sharedsource/imageset.h"

namespace sharedsource {

ImageSet ImageSetForDpi(int dotsPerInch)
{
    if (dotsPerInch < 132)
        return ImageSet::Normal;
    if (dotsPerInch < 168)
        return ImageSet::Large;
    return ImageSet::Huge;
}

QString ImagePath(const QString &name, ImageSet set)
{
    const int resolution = set == ImageSet::Normal ? 96 : set == ImageSet::Large ? 144 : 192;
    return QStringLiteral(":/sorvik/images/%1_%2.png").arg(name).arg(resolution);
}

QPixmap LoadImage(const QString &name, int dotsPerInch)
{
    return QPixmap(ImagePath(name, ImageSetForDpi(dotsPerInch)));
}

} // namespace sharedsource
