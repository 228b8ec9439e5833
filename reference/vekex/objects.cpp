#include "reference/vekex/objects.h"

#include "sorvik/wstringqt.h"
#include "reference/vekex/querypath.h"

#include <QDateTime>
#include <QFileInfo>

#include <mutex>
#include <vector>

namespace sorvik::vekex {

namespace {

using cv::krn::FromQString;
using cv::krn::RefPtr;
using cv::krn::ToQString;
using cv::krn::WString;
namespace status = cv::vekex::status;

template <typename Body>
auto Guard(std::int32_t *status, Body &&body)
{
    return ref::Guarded(kCodes, status, std::forward<Body>(body));
}

[[noreturn]] void NotFound(const QString &what)
{
    ref::Fail(status::NotFound, what.toStdU16String());
}

QString FlagText(bool flag)
{
    return flag ? QStringLiteral("1") : QStringLiteral("0");
}

class ByteValue final : public ref::RefObject<cv::vekex::IByteValue>
{
public:
    explicit ByteValue(QByteArray bytes) : m_bytes(std::move(bytes)) {}
    std::uint32_t GetSize() override { return std::uint32_t(m_bytes.size()); }
    const std::uint8_t *GetData() override
    {
        return m_bytes.isEmpty() ? nullptr : reinterpret_cast<const std::uint8_t *>(m_bytes.constData());
    }

private:
    QByteArray m_bytes;
};

class InstList final : public ref::RefObject<cv::vekex::IInstList>
{
public:
    std::uint32_t GetCount() override { return std::uint32_t(m_items.size()); }
    IUnknown *GetAt(std::uint32_t index, std::int32_t *status) override
    {
        return Guard(status, [&]() -> IUnknown * {
            if (index >= m_items.size())
                ref::Fail(status::OutOfRange, u"the index lies beyond the list");
            return RefPtr<IUnknown>(m_items[index]).Detach();
        });
    }
    void Append(IUnknown *object, std::int32_t *status) override
    {
        Guard(status, [&] {
            if (!object)
                ref::Fail(status::InvalidArgument, u"a list holds no null objects");
            m_items.push_back(RefPtr<IUnknown>::Share(object));
        });
    }
    void Clear() override { m_items.clear(); }

    void Add(RefPtr<IUnknown> object) { m_items.push_back(std::move(object)); }

private:
    std::vector<RefPtr<IUnknown>> m_items;
};

class ContainerList final : public ref::RefObject<cv::vekex::IContainerList>
{
public:
    std::uint32_t GetCount() override { return std::uint32_t(m_items.size()); }
    cv::vekex::IContainer *GetAt(std::uint32_t index, std::int32_t *status) override
    {
        return Guard(status, [&]() -> cv::vekex::IContainer * {
            if (index >= m_items.size())
                ref::Fail(status::OutOfRange, u"the index lies beyond the list");
            return RefPtr<cv::vekex::IContainer>(m_items[index]).Detach();
        });
    }
    void Append(cv::vekex::IContainer *container, std::int32_t *status) override
    {
        Guard(status, [&] {
            if (!container)
                ref::Fail(status::InvalidArgument, u"a list holds no null containers");
            m_items.push_back(RefPtr<cv::vekex::IContainer>::Share(container));
        });
    }
    void Clear() override { m_items.clear(); }

private:
    std::vector<RefPtr<cv::vekex::IContainer>> m_items;
};

class Container final : public ref::RefObject<cv::vekex::IContainer>
{
public:
    std::uint32_t GetCount() override { return std::uint32_t(m_texts.size()); }
    const WString *GetElements() override { return m_texts.empty() ? nullptr : m_texts.data(); }

    void AssignFromArray(const WString *items, std::uint32_t count, std::int32_t *status) override
    {
        Guard(status, [&] {
            if (!items && count != 0)
                ref::Fail(status::InvalidArgument, u"no items for a non-zero count");
            m_texts.assign(items, items + count);
        });
    }
    void Append(const WString &item, std::int32_t *status) override
    {
        Guard(status, [&] { m_texts.push_back(item); });
    }
    void Clear() override
    {
        m_texts.clear();
        m_values.clear();
    }
    std::uint32_t GetValueCount() override { return std::uint32_t(m_values.size()); }
    const std::int16_t *GetValues() override { return m_values.empty() ? nullptr : m_values.data(); }
    void AssignValues(const std::int16_t *values, std::uint32_t count, std::int32_t *status) override
    {
        Guard(status, [&] {
            if (!values && count != 0)
                ref::Fail(status::InvalidArgument, u"no values for a non-zero count");
            m_values.assign(values, values + count);
        });
    }

private:
    std::vector<WString> m_texts;
    std::vector<std::int16_t> m_values;
};

// What every node of the query interface shares: selection over the catalogue.
class QueryNode : public ref::RefObject<cv::vekex::IVekQuery>
{
public:
    explicit QueryNode(std::shared_ptr<const Catalogue> catalogue) : m_catalogue(std::move(catalogue)) {}

    HRESULT QueryInterface(REFIID iid, void **object) override
    {
        if (!object)
            return E_POINTER;
        if (iid == IID_IUnknown || iid == cv::vekex::IID_IVekQuery) {
            *object = static_cast<cv::vekex::IVekQuery *>(this);
            AddRef();
            return S_OK;
        }
        *object = nullptr;
        return E_NOINTERFACE;
    }

    cv::vekex::IInstList *SelectElements(const WString &path, std::int32_t *status) override
    {
        return Guard(status, [&] {
            auto list = RefPtr<InstList>::Adopt(new InstList);
            for (RefPtr<IUnknown> &element : Select(ToQString(path), false))
                list->Add(std::move(element));
            return static_cast<cv::vekex::IInstList *>(list.Detach());
        });
    }

    IUnknown *SelectElement(const WString &path, std::int32_t *status) override
    {
        return Guard(status, [&]() -> IUnknown * {
            std::vector<RefPtr<IUnknown>> found = Select(ToQString(path), true);
            return found.empty() ? nullptr : found.front().Detach();
        });
    }

    WString GetTextAttribute(const WString &name, std::int32_t *status) override
    {
        return Guard(status, [&] { return FromQString(Attribute(ToQString(name))); });
    }

    cv::vekex::IByteValue *GetAttribute(const WString &name, std::int32_t *status) override
    {
        return Guard(status, [&]() -> cv::vekex::IByteValue * {
            const QString attribute = ToQString(name);
            QByteArray bytes = attribute == u"icon" ? Icon() : Attribute(attribute).toUtf8();
            return new ByteValue(std::move(bytes));
        });
    }

protected:
    // The text of an attribute of this node; NotFound when it has none.
    virtual QString Attribute(const QString &name) const = 0;
    virtual QByteArray Icon() const { NotFound(QStringLiteral("this element has no attribute \"icon\"")); }
    // The store type whose file filters a relative path selects, or none.
    virtual const StoreType *Parent() const { return nullptr; }

    const std::shared_ptr<const Catalogue> m_catalogue;

private:
    std::vector<RefPtr<IUnknown>> Select(const QString &text, bool firstOnly);
};

[[noreturn]] void InvalidTerm(const QString &attribute)
{
    ref::Fail(status::InvalidQuery,
              QStringLiteral("\"%1\" is not an attribute of the selected elements").arg(attribute).toStdU16String());
}

bool FlagMatches(const QString &value, bool flag)
{
    if (value == u"1" || value.compare(u"true", Qt::CaseInsensitive) == 0)
        return flag;
    if (value == u"0" || value.compare(u"false", Qt::CaseInsensitive) == 0)
        return !flag;
    ref::Fail(status::InvalidQuery, QStringLiteral("\"%1\" is not a flag value").arg(value).toStdU16String());
}

bool TextMatches(const QString &value, const QString &text)
{
    return value.compare(text, Qt::CaseInsensitive) == 0;
}

bool StoreTypeMatches(const StoreType &type, const QueryPath &path)
{
    bool all = true;
    for (const auto &[attribute, value] : path.terms) {
        bool match;
        if (attribute == u"name")
            match = TextMatches(value, type.name);
        else if (attribute == u"model")
            match = TextMatches(value, type.model);
        else if (attribute == u"description")
            match = TextMatches(value, type.description);
        else if (attribute == u"icon")
            match = TextMatches(value, type.iconFile);
        else if (attribute == u"system")
            match = FlagMatches(value, type.system);
        else if (attribute == u"importsupported")
            match = FlagMatches(value, type.importSupported);
        else
            InvalidTerm(attribute);
        all = all && match; // every term is checked, so a bad one is reported
    }
    return all;
}

bool FileFilterMatches(const FileFilter &filter, const QueryPath &path)
{
    bool all = true;
    for (const auto &[attribute, value] : path.terms) {
        bool match;
        if (attribute == u"extension")
            match = TextMatches(value, filter.extension);
        else if (attribute == u"userdefined")
            match = FlagMatches(value, filter.userDefined);
        else
            InvalidTerm(attribute);
        all = all && match;
    }
    return all;
}

class FileFilterElement final : public QueryNode
{
public:
    FileFilterElement(std::shared_ptr<const Catalogue> catalogue, const FileFilter *filter)
        : QueryNode(std::move(catalogue)), m_filter(filter)
    {
    }

protected:
    QString Attribute(const QString &name) const override
    {
        if (name == u"extension")
            return m_filter->extension;
        if (name == u"userdefined")
            return FlagText(m_filter->userDefined);
        NotFound(QStringLiteral("a file filter has no attribute \"%1\"").arg(name));
    }

private:
    const FileFilter *m_filter; // owned by the catalogue this node holds
};

class StoreTypeElement final : public QueryNode
{
public:
    StoreTypeElement(std::shared_ptr<const Catalogue> catalogue, const StoreType *type)
        : QueryNode(std::move(catalogue)), m_type(type)
    {
    }

protected:
    QString Attribute(const QString &name) const override
    {
        if (name == u"name")
            return m_type->name;
        if (name == u"model")
            return m_type->model;
        if (name == u"description")
            return m_type->description;
        if (name == u"icon")
            return m_type->iconFile;
        if (name == u"system")
            return FlagText(m_type->system);
        if (name == u"importsupported")
            return FlagText(m_type->importSupported);
        NotFound(QStringLiteral("a store type has no attribute \"%1\"").arg(name));
    }
    QByteArray Icon() const override { return m_type->icon; }
    const StoreType *Parent() const override { return m_type; }

private:
    const StoreType *m_type;
};

std::vector<RefPtr<IUnknown>> QueryNode::Select(const QString &text, bool firstOnly)
{
    const QueryPath path = ParseQueryPath(text);
    std::vector<RefPtr<IUnknown>> found;
    if (path.collection == QueryPath::Collection::StoreTypes) {
        for (const StoreType &type : m_catalogue->types) {
            if (StoreTypeMatches(type, path)) {
                found.push_back(RefPtr<IUnknown>::Adopt(new StoreTypeElement(m_catalogue, &type)));
                if (firstOnly)
                    break;
            }
        }
        return found;
    }
    const StoreType *parent = Parent();
    if (!parent)
        ref::Fail(status::InvalidQuery, u"file filters are selected from a store-type element");
    for (const FileFilter &filter : parent->filters) {
        if (FileFilterMatches(filter, path)) {
            found.push_back(RefPtr<IUnknown>::Adopt(new FileFilterElement(m_catalogue, &filter)));
            if (firstOnly)
                break;
        }
    }
    return found;
}

class StoreTypeDescription final : public ref::RefObject<cv::vekex::IStoreTypeDescription>
{
public:
    StoreTypeDescription(std::shared_ptr<const Catalogue> catalogue, const StoreType *type)
        : m_catalogue(std::move(catalogue)), m_type(type)
    {
    }

    WString GetName(std::int32_t *) override { return FromQString(m_type->name); }
    WString GetModel(std::int32_t *) override { return FromQString(m_type->model); }
    cv::vekex::IStringList *GetFilePatterns(std::int32_t *status) override
    {
        return Guard(status, [&]() -> cv::vekex::IStringList * {
            std::vector<WString> patterns;
            for (const FileFilter &filter : m_type->filters)
                patterns.push_back(FromQString(QStringLiteral("*.") + filter.extension));
            return new ref::StringList(std::move(patterns));
        });
    }
    bool IsSystem(std::int32_t *) override { return m_type->system; }
    bool IsImportSupported(std::int32_t *) override { return m_type->importSupported; }

private:
    const std::shared_ptr<const Catalogue> m_catalogue;
    const StoreType *m_type;
};

class StoreTypeCatalogue final : public ref::RefObject<cv::vekex::IStoreTypeCatalogue>
{
public:
    explicit StoreTypeCatalogue(std::shared_ptr<const Catalogue> catalogue) : m_catalogue(std::move(catalogue)) {}

    cv::vekex::IStringList *ListStoreTypes(const WString &modelFilter, const WString &extension,
                                           std::int32_t *status) override
    {
        return Guard(status, [&]() -> cv::vekex::IStringList * {
            const QString model = ToQString(modelFilter);
            const QString wanted = ToQString(extension);
            std::vector<WString> names;
            for (const StoreType &type : m_catalogue->types) {
                if (!model.isEmpty() && !type.model.contains(model, Qt::CaseInsensitive))
                    continue;
                if (!wanted.isEmpty() && !type.ReadsExtension(wanted))
                    continue;
                names.push_back(FromQString(type.name));
            }
            return new ref::StringList(std::move(names));
        });
    }

    cv::vekex::IStoreTypeDescription *GetStoreType(const WString &name, std::int32_t *status) override
    {
        return Guard(status, [&]() -> cv::vekex::IStoreTypeDescription * {
            const StoreType *type = m_catalogue->Find(ToQString(name));
            if (!type)
                NotFound(QStringLiteral("the catalogue has no store type \"%1\"").arg(ToQString(name)));
            return new StoreTypeDescription(m_catalogue, type);
        });
    }

private:
    const std::shared_ptr<const Catalogue> m_catalogue;
};

class DataStoreManager final : public ref::RefObject<cv::vekex::IDataStoreManager>
{
public:
    explicit DataStoreManager(std::shared_ptr<const Catalogue> catalogue) : m_catalogue(std::move(catalogue)) {}

    cv::vekex::IStoreTypeCatalogue *GetStoreTypes(std::int32_t *status) override
    {
        return Guard(status, [&]() -> cv::vekex::IStoreTypeCatalogue * { return new StoreTypeCatalogue(m_catalogue); });
    }

private:
    const std::shared_ptr<const Catalogue> m_catalogue;
};

// The root of the query interface; QueryInterface answers both interfaces.
class Configuration final : public QueryNode, public cv::vekex::IConfiguration
{
public:
    explicit Configuration(std::shared_ptr<const Catalogue> catalogue) : QueryNode(std::move(catalogue)) {}

    HRESULT QueryInterface(REFIID iid, void **object) override
    {
        if (!object)
            return E_POINTER;
        if (iid == IID_IUnknown) {
            *object = static_cast<cv::vekex::IConfiguration *>(this);
            AddRef();
            return S_OK;
        }
        return QueryNode::QueryInterface(iid, object);
    }
    std::uint32_t AddRef() override { return QueryNode::AddRef(); }
    std::uint32_t Release() override { return QueryNode::Release(); }

    WString GetName(std::int32_t *) override { return WString(cv::vekex::kDataStoreConfiguration); }
    cv::vekex::IDataStoreManager *GetDataStoreManager(std::int32_t *status) override
    {
        return Guard(status, [&]() -> cv::vekex::IDataStoreManager * { return new DataStoreManager(m_catalogue); });
    }

protected:
    QString Attribute(const QString &name) const override
    {
        if (name == u"name")
            return QString::fromUtf16(cv::vekex::kDataStoreConfiguration);
        NotFound(QStringLiteral("the configuration has no attribute \"%1\"").arg(name));
    }
};

class Environment final : public ref::RefObject<cv::vekex::IEnvironment>
{
public:
    explicit Environment(std::int32_t kind) : m_kind(kind) {}

    cv::vekex::IConfiguration *GetConfiguration(const WString &name, std::int32_t flags, std::int32_t *status) override
    {
        return Guard(status, [&]() -> cv::vekex::IConfiguration * {
            if (ToQString(name).compare(QString::fromUtf16(cv::vekex::kDataStoreConfiguration), Qt::CaseInsensitive) != 0)
                NotFound(QStringLiteral("there is no configuration \"%1\"").arg(ToQString(name)));
            if (flags != 0)
                ref::Fail(status::InvalidArgument, u"the flags of GetConfiguration must be 0");
            return new Configuration(CurrentCatalogue());
        });
    }
    std::int32_t GetKind(std::int32_t *) override { return m_kind; }

private:
    const std::int32_t m_kind;
};

struct CatalogueCache
{
    std::mutex lock;
    int uses = 0;
    QString path;
    QDateTime modified;
    qint64 size = -1;
    std::shared_ptr<const Catalogue> catalogue;
};

CatalogueCache &Cache()
{
    static CatalogueCache cache;
    return cache;
}

} // namespace

cv::vekex::IEnvironment *NewEnvironment(std::int32_t kind)
{
    return new Environment(kind);
}

cv::vekex::IContainer *NewContainer()
{
    return new Container;
}

cv::vekex::IInstList *NewInstList()
{
    return new InstList;
}

cv::vekex::IContainerList *NewContainerList()
{
    return new ContainerList;
}

std::shared_ptr<const Catalogue> CurrentCatalogue()
{
    const QString path = CataloguePath();
    const QFileInfo info(path);
    CatalogueCache &cache = Cache();
    std::lock_guard guard(cache.lock);
    if (cache.uses > 0 && cache.catalogue && cache.path == path && info.exists() &&
        cache.modified == info.lastModified() && cache.size == info.size())
        return cache.catalogue;
    std::shared_ptr<const Catalogue> catalogue = LoadCatalogue(path);
    if (cache.uses > 0) {
        cache.path = path;
        cache.modified = info.lastModified();
        cache.size = info.size();
        cache.catalogue = catalogue;
    }
    return catalogue;
}

void TakeUse()
{
    CatalogueCache &cache = Cache();
    std::lock_guard guard(cache.lock);
    ++cache.uses;
}

void ReleaseUse()
{
    CatalogueCache &cache = Cache();
    std::lock_guard guard(cache.lock);
    if (cache.uses > 0 && --cache.uses == 0)
        cache.catalogue.reset();
}

} // namespace sorvik::vekex
