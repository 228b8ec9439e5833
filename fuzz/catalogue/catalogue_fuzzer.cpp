// Feeds arbitrary bytes to the Parselet catalogue reader, as if they were the
// file beside the library. Icons are looked for in a folder that does not
// exist, so an icon attribute ends in a clear refusal, never in a read of
// whatever the name points at.

#include "reference/libsupport/refobject.h"
#include "reference/vekex/catalogue.h"
#include "sorvik/vekex.h"

#include <QByteArray>
#include <QSet>

#include <cstdlib>

namespace {

void Require(bool condition)
{
    if (!condition)
        std::abort();
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t *data, std::size_t size)
{
    const QByteArray bytes(reinterpret_cast<const char *>(data), qsizetype(size));
    try {
        const auto catalogue =
            sorvik::vekex::ParseCatalogue(QStringLiteral("/nonexistent-catalogue-folder/vekex-parselets.xml"), bytes);
        QSet<QString> names;
        for (const auto &type : catalogue->types) {
            Require(!type.name.isEmpty() && !type.model.isEmpty());
            Require(!names.contains(type.name.toCaseFolded()));
            names.insert(type.name.toCaseFolded());
            Require(catalogue->Find(type.name) == &type);
            for (const auto &filter : type.filters)
                Require(type.ReadsExtension(filter.extension) && !filter.extension.startsWith(u'.'));
        }
    } catch (const sorvik::ref::Failure &failure) {
        Require((failure.code == cv::vekex::status::CatalogueMalformed ||
                 failure.code == cv::vekex::status::CatalogueUnreadable) &&
                !failure.text.empty());
    }
    return 0;
}
