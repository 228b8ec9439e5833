#pragma once

// Every dialog of the module in each of its states, rendered to PNG files
// so that anyone can look at them without a server or a display.

#include "sorvik/logfont.h"

#include <QString>
#include <QStringList>

namespace cv::vek::rovo {

// The files written (names only), in order; empty when nothing could be written.
QStringList RenderDialogGallery(const QString &folder, const LOGFONTW *font);

} // namespace cv::vek::rovo
