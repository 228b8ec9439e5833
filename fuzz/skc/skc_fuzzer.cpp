// Feeds arbitrary bytes to the configuration file reader, against the
// Parselets of the shipped catalogue. A file is either refused with
// FileMalformed and a text, or read; what was read is written again and
// must read back to the same file.

#include "reference/libsupport/refobject.h"
#include "reference/rovoapi/catalogueinfo.h"
#include "reference/rovoapi/skc.h"
#include "sorvik/rovoapi.h"

#include <QByteArray>

#include <cstdlib>

namespace {

using namespace sorvik::rovo;

void Require(bool condition)
{
    if (!condition)
        std::abort();
}

ParseletInfo Parselet(const char *name, std::vector<QString> extensions, bool importSupported = true,
                      bool system = false)
{
    ParseletInfo info;
    info.name = QString::fromLatin1(name);
    info.model = QStringLiteral("QDM_1_") + info.name;
    info.importSupported = importSupported;
    info.system = system;
    info.extensions = std::move(extensions);
    return info;
}

const CatalogueInfo &Catalogue()
{
    static const CatalogueInfo catalogue{{
        Parselet("qdm", {QStringLiteral("qdm")}),
        Parselet("CSV", {QStringLiteral("csv"), QStringLiteral("txt")}),
        Parselet("TextTable", {QStringLiteral("txt")}),
        Parselet("WaveAudio", {QStringLiteral("wav")}),
        Parselet("MatrixStore", {QStringLiteral("mat")}, false),
        Parselet("IndexJournal", {}, true, true),
    }};
    return catalogue;
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t *data, std::size_t size)
{
    const QByteArray bytes(reinterpret_cast<const char *>(data), qsizetype(size));
    Configuration configuration;
    try {
        configuration = ParseConfiguration(QStringLiteral("fuzz.skc"), bytes, Catalogue());
    } catch (const sorvik::ref::Failure &failure) {
        Require(failure.code == cv::rovo::status::FileMalformed && !failure.text.empty());
        return 0;
    }
    const QByteArray written = SerializeConfiguration(configuration);
    try {
        const Configuration again = ParseConfiguration(QStringLiteral("again.skc"), written, Catalogue());
        Require(SerializeConfiguration(again) == written);
    } catch (const sorvik::ref::Failure &) {
        // A configuration that was read must be written so that it reads again.
        std::abort();
    }
    return 0;
}
