#include "reference/rovoapi/catalogueinfo.h"

#include "reference/libsupport/refobject.h"
#include "reference/rovoapi/config.h"
#include "sorvik/rovoapi.h"
#include "sorvik/wstringqt.h"

#include <algorithm>

namespace sorvik::rovo {

namespace {

using cv::krn::RefPtr;
using cv::krn::ToQString;

// Calls into the data-store library; a non-zero status ends the read.
template <typename Call>
auto Checked(Call &&call)
{
    std::int32_t status = 0;
    auto result = call(&status);
    if (status != 0) {
        ref::Fail(cv::rovo::status::CatalogueFailed,
                  QStringLiteral("the data-store library could not supply the Parselet catalogue (status %1)")
                      .arg(status)
                      .toStdU16String());
    }
    return result;
}

} // namespace

bool ParseletInfo::Reads(const QString &extensionKey) const
{
    for (const QString &extension : extensions) {
        if (extension == extensionKey)
            return true;
    }
    return false;
}

const ParseletInfo *CatalogueInfo::Find(const QString &name) const
{
    for (const ParseletInfo &parselet : parselets) {
        if (parselet.name.compare(name, Qt::CaseInsensitive) == 0)
            return &parselet;
    }
    return nullptr;
}

const ParseletInfo &CatalogueInfo::Require(const QString &name, std::int32_t code) const
{
    const ParseletInfo *found = Find(name);
    if (!found)
        ref::Fail(code, QStringLiteral("there is no Parselet \"%1\"").arg(name).toStdU16String());
    return *found;
}

std::vector<const ParseletInfo *> ExtensionParselets(const CatalogueInfo &catalogue, const QString &extensionKey,
                                                     const std::vector<QString> &explicitOrder,
                                                     const std::function<bool(const ParseletInfo &)> &isActive)
{
    std::vector<const ParseletInfo *> order;
    for (const QString &name : explicitOrder) {
        const ParseletInfo *parselet = catalogue.Find(name);
        if (parselet && std::find(order.begin(), order.end(), parselet) == order.end())
            order.push_back(parselet);
    }
    for (const ParseletInfo &parselet : catalogue.parselets) {
        if (std::find(order.begin(), order.end(), &parselet) == order.end())
            order.push_back(&parselet);
    }
    std::vector<const ParseletInfo *> result;
    for (const ParseletInfo *parselet : order) {
        if (parselet->Reads(extensionKey) && isActive(*parselet))
            result.push_back(parselet);
    }
    return result;
}

std::shared_ptr<const CatalogueInfo> ReadCatalogueInfo(cv::vekex::IEnvironment *dataStore)
{
    if (!dataStore)
        ref::Fail(cv::rovo::status::CatalogueFailed, u"there is no data-store environment");
    auto configuration = RefPtr<cv::vekex::IConfiguration>::Adopt(Checked([&](std::int32_t *status) {
        return dataStore->GetConfiguration(cv::krn::WString(cv::vekex::kDataStoreConfiguration), 0, status);
    }));
    auto manager = RefPtr<cv::vekex::IDataStoreManager>::Adopt(
        Checked([&](std::int32_t *status) { return configuration->GetDataStoreManager(status); }));
    auto catalogue = RefPtr<cv::vekex::IStoreTypeCatalogue>::Adopt(
        Checked([&](std::int32_t *status) { return manager->GetStoreTypes(status); }));
    auto names = RefPtr<cv::vekex::IStringList>::Adopt(Checked([&](std::int32_t *status) {
        return catalogue->ListStoreTypes(cv::krn::WString(), cv::krn::WString(), status);
    }));
    if (!configuration || !manager || !catalogue || !names)
        ref::Fail(cv::rovo::status::CatalogueFailed, u"the data-store library returned no catalogue");

    auto info = std::make_shared<CatalogueInfo>();
    for (std::uint32_t i = 0; i < names->GetCount(); ++i) {
        const cv::krn::WString &name = names->GetElements()[i];
        auto type = RefPtr<cv::vekex::IStoreTypeDescription>::Adopt(
            Checked([&](std::int32_t *status) { return catalogue->GetStoreType(name, status); }));
        auto patterns = RefPtr<cv::vekex::IStringList>::Adopt(
            Checked([&](std::int32_t *status) { return type->GetFilePatterns(status); }));
        ParseletInfo parselet;
        parselet.name = ToQString(name);
        parselet.model = ToQString(Checked([&](std::int32_t *status) { return type->GetModel(status); }));
        parselet.system = Checked([&](std::int32_t *status) { return type->IsSystem(status); });
        parselet.importSupported = Checked([&](std::int32_t *status) { return type->IsImportSupported(status); });
        for (std::uint32_t k = 0; patterns && k < patterns->GetCount(); ++k) {
            QString pattern = ToQString(patterns->GetElements()[k]);
            if (pattern.startsWith(QStringLiteral("*.")))
                pattern.remove(0, 2);
            parselet.extensions.push_back(Key(pattern));
        }
        info->parselets.push_back(std::move(parselet));
    }
    return info;
}

} // namespace sorvik::rovo
