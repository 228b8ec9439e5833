#include "reference/rovoapi/propertyobjects.h"

#include "reference/libsupport/refobject.h"
#include "reference/managerchannel/managermessage.h"
#include "reference/managerchannel/managerprotocol.h"
#include "reference/rovoapi/objects.h"
#include "reference/rovoapi/store.h"
#include "sorvik/wstringqt.h"

#include <QJsonArray>
#include <QJsonDocument>

#include <map>
#include <mutex>
#include <vector>

namespace sorvik::rovo {

namespace {

namespace status = cv::rovo::status;
namespace field = manager::field;
using cv::krn::FromQString;
using cv::krn::ToQString;
using cv::krn::WString;

constexpr const char *kLevelKeys[] = {"sorvik_root", "qdm_channelgroup", "qdm_channel"};

// The optimization states a property can be given: the server's default
// data type, integer, numeric, string, time.
constexpr std::uint32_t kDataTypes[] = {cv::rovo::kOptimizedDefault, 3, 10, 23, 30};

template <typename Body>
auto Guard(std::int32_t *status, Body &&body)
{
    return ref::Guarded(kCodes, status, std::forward<Body>(body));
}

[[noreturn]] void Bad(std::int32_t code, const QString &text)
{
    ref::Fail(code, text.toStdU16String());
}

template <typename T>
T &Required(T *pointer, const char *what)
{
    if (!pointer)
        Bad(status::InvalidArgument, QStringLiteral("%1 is null").arg(QLatin1String(what)));
    return *pointer;
}

[[noreturn]] void Unreadable(const char *what)
{
    Bad(status::Internal, QStringLiteral("the server answered %1 in a form this library does not read").arg(QLatin1String(what)));
}

std::uint32_t Unsigned(const QJsonObject &object, QLatin1String name, const char *what)
{
    const auto value = manager::IntegerField(object, name, 0, UINT32_MAX);
    if (!value)
        Unreadable(what);
    return std::uint32_t(*value);
}

QJsonArray Array(const QJsonObject &answer, QLatin1String name, const char *what)
{
    const QJsonValue value = answer.value(name);
    if (!value.isArray())
        Unreadable(what);
    return value.toArray();
}

QJsonObject LevelRequest(QLatin1String op, const QString &level)
{
    return QJsonObject{{manager::kOp, op}, {field::Level, level}};
}

class LevelDescription final : public ref::RefObject<cv::rovo::ILevelDescription>
{
public:
    LevelDescription(QString name, std::map<QString, QString> displayNames)
        : m_name(std::move(name)), m_displayNames(std::move(displayNames))
    {
    }

    WString GetName(std::int32_t *) override { return FromQString(m_name); }

    // Nothing for a language the server has no name in.
    const QString *DisplayName(const QString &language) const
    {
        const auto found = m_displayNames.find(language);
        return found == m_displayNames.end() ? nullptr : &found->second;
    }

private:
    const QString m_name;
    const std::map<QString, QString> m_displayNames;
};

class Translator final : public ref::RefObject<cv::rovo::ITranslator>
{
public:
    explicit Translator(QString language) : m_language(std::move(language)) {}

    WString GetDisplayName(cv::rovo::ILevelDescription *level, std::int32_t *status) override
    {
        return Guard(status, [&] {
            const auto *own = dynamic_cast<const LevelDescription *>(&Required(level, "the level description"));
            if (!own)
                Bad(status::InvalidArgument, QStringLiteral("the level description is not one of this library"));
            const QString *name = own->DisplayName(m_language);
            if (!name)
                Bad(status::NotFound, QStringLiteral("the level has no display name in \"%1\"").arg(m_language));
            return FromQString(*name);
        });
    }

private:
    const QString m_language;
};

class PropertyModel final : public ref::RefObject<cv::rovo::IPropertyModel>
{
public:
    struct Level
    {
        QString name;
        std::map<QString, QString> displayNames;
    };

    explicit PropertyModel(std::vector<Level> levels) : m_levels(std::move(levels)) {}

    cv::rovo::ITranslator *GetTranslator(const WString &language, std::int32_t *status) override
    {
        return Guard(status, [&]() -> cv::rovo::ITranslator * {
            const QString code = ToQString(language);
            for (const Level &level : m_levels) {
                if (level.displayNames.count(code))
                    return new Translator(code);
            }
            Bad(status::NotFound, QStringLiteral("the server has no display names in the language \"%1\"").arg(code));
        });
    }

    cv::rovo::ILevelDescription *GetLevel(const WString &name, std::int32_t *status) override
    {
        return Guard(status, [&]() -> cv::rovo::ILevelDescription * {
            const QString wanted = ToQString(name);
            for (const Level &level : m_levels) {
                if (level.name.compare(wanted, Qt::CaseInsensitive) == 0)
                    return new LevelDescription(level.name, level.displayNames);
            }
            return nullptr;
        });
    }

private:
    const std::vector<Level> m_levels;
};

class LevelPropertyList final : public ref::RefObject<cv::rovo::ILevelPropertyList>
{
public:
    LevelPropertyList(std::shared_ptr<const Instance> instance, QString level)
        : m_instance(std::move(instance)), m_level(std::move(level))
    {
    }

    void Fetch(std::int32_t *status) override
    {
        Guard(status, [&] {
            const QJsonArray answer = Array(m_instance->Ask(LevelRequest(manager::op::LevelProperties, m_level)),
                                            field::Properties, "a property list");
            std::vector<Entry> properties;
            for (const QJsonValue &item : answer) {
                const QJsonObject property = item.toObject();
                const QJsonValue name = property.value(field::Name);
                if (!name.isString())
                    Unreadable("a property list");
                properties.push_back({FromQString(name.toString()), Unsigned(property, field::Occurrences, "a property list")});
            }
            std::lock_guard guard(m_lock);
            m_properties = std::move(properties);
        });
    }

    std::uint32_t GetCount(std::int32_t *status) override
    {
        return Guard(status, [&] {
            std::lock_guard guard(m_lock);
            return std::uint32_t(m_properties.size());
        });
    }

    void GetProperty(std::uint32_t index, WString *name, std::uint32_t *occurrences, std::int32_t *status) override
    {
        Guard(status, [&] {
            Required(name, "the name out-argument");
            Required(occurrences, "the occurrences out-argument");
            std::lock_guard guard(m_lock);
            if (index >= m_properties.size())
                Bad(status::InvalidArgument,
                    QStringLiteral("there is no property %1 of %2").arg(index).arg(m_properties.size()));
            *name = m_properties[index].name;
            *occurrences = m_properties[index].occurrences;
        });
    }

    void StartOccurrenceCount(std::int32_t *status) override
    {
        Guard(status, [&] { m_instance->Ask(LevelRequest(manager::op::CountOccurrences, m_level)); });
    }

    bool IsCountingOccurrences(std::int32_t *status) override
    {
        return Guard(status, [&] {
            return m_instance->Ask(LevelRequest(manager::op::CountingOccurrences, m_level)).value(field::Counting).toBool();
        });
    }

private:
    struct Entry
    {
        WString name;
        std::uint32_t occurrences;
    };

    const std::shared_ptr<const Instance> m_instance;
    const QString m_level;
    std::mutex m_lock;
    std::vector<Entry> m_properties; // as of the last Fetch
};

class IndexStatus final : public ref::RefObject<cv::rovo::IIndexStatus>
{
public:
    explicit IndexStatus(std::shared_ptr<const Instance> instance) : m_instance(std::move(instance)) {}

    void GetIndexingProgress(std::uint32_t *done, std::uint32_t *total, cv::rovo::ProgressTime *time,
                             std::int32_t *status) override
    {
        Guard(status, [&] {
            Required(done, "the done out-argument");
            Required(total, "the total out-argument");
            Required(time, "the time out-argument");
            const QJsonObject answer = m_instance->Ask(QJsonObject{{manager::kOp, manager::op::IndexingProgress}});
            const std::uint32_t doneCount = Unsigned(answer, field::Done, "its indexing progress");
            const std::uint32_t totalCount = Unsigned(answer, field::Total, "its indexing progress");
            std::optional<std::int64_t> when;
            if (answer.contains(field::Time)) {
                when = manager::IntegerField(answer, field::Time, 0, INT64_MAX);
                if (!when)
                    Unreadable("its indexing progress");
            }
            *done = doneCount;
            *total = totalCount;
            if (when) {
                const auto ms = std::uint64_t(*when);
                *time = cv::rovo::ProgressTime{{std::uint32_t(ms), std::uint32_t(ms >> 32), 0, 0}};
            }
        });
    }

    void GetOptimizationState(const WString &level, const WString &property, std::uint32_t *state,
                              std::int32_t *status) override
    {
        Guard(status, [&] {
            Required(state, "the state out-argument");
            QJsonObject request = LevelRequest(manager::op::OptimizationState, RequireLevelKey(level));
            request.insert(field::Property, ToQString(property));
            *state = Unsigned(m_instance->Ask(request), field::State, "an optimization state");
        });
    }

    cv::vekex::IStringList *ListOptimizedProperties(const WString &level, cv::vekex::IContainer *states,
                                                    std::int32_t *status) override
    {
        return Guard(status, [&]() -> cv::vekex::IStringList * {
            Required(states, "the container");
            const QJsonArray answer = Array(
                m_instance->Ask(LevelRequest(manager::op::OptimizedProperties, RequireLevelKey(level))),
                field::Properties, "its optimized properties");
            std::vector<WString> names;
            std::vector<std::int16_t> values;
            for (const QJsonValue &item : answer) {
                const QJsonObject property = item.toObject();
                const QJsonValue name = property.value(field::Name);
                const auto state = manager::IntegerField(property, field::State, 0, INT16_MAX);
                if (!name.isString() || !state)
                    Unreadable("its optimized properties");
                names.push_back(FromQString(name.toString()));
                values.push_back(std::int16_t(*state));
            }
            std::int32_t assigned = 0;
            states->AssignValues(values.data(), std::uint32_t(values.size()), &assigned);
            if (assigned != 0)
                Bad(status::Internal, QStringLiteral("the container does not take the states (status %1)").arg(assigned));
            return new ref::StringList(std::move(names));
        });
    }

private:
    const std::shared_ptr<const Instance> m_instance;
};

class OptimizationEditor final : public ref::RefObject<cv::rovo::IOptimizationEditor>
{
public:
    explicit OptimizationEditor(QString storeFile) : m_storeFile(std::move(storeFile)) {}

    void UnoptimizeProperty(const WString &level, const cv::rovo::PropertyRecord *property, std::int32_t *status) override
    {
        Guard(status, [&] { Record(RequireLevelKey(level), Name(property), std::nullopt); });
    }

    void OptimizeProperty(const WString &level, const cv::rovo::PropertyRecord *property, std::uint32_t dataType,
                          std::int32_t *status) override
    {
        Guard(status, [&] {
            if (std::find(std::begin(kDataTypes), std::end(kDataTypes), dataType) == std::end(kDataTypes))
                Bad(status::InvalidArgument,
                    QStringLiteral("%1 is not a data type (0 the server's default, 3, 10, 23 or 30)").arg(dataType));
            Record(RequireLevelKey(level), Name(property), dataType);
        });
    }

    void Commit(std::int32_t *status) override
    {
        Guard(status, [&] {
            std::vector<Change> changes;
            {
                std::lock_guard guard(m_lock);
                changes = m_changes;
            }
            if (changes.empty())
                return;
            const auto db = OpenStore(m_storeFile, false);
            std::lock_guard dbGuard(db->Lock());
            db->SetBusyTimeout(CommitTimeoutMilliseconds());
            Transaction transaction(*db, Transaction::Kind::Write, status::UpdateTimedOut);
            for (const Change &change : changes)
                AddRequest(*db, change.state ? manager::request::OptimizeProperty : manager::request::UnoptimizeProperty,
                           Argument(change));
            const std::int64_t generation = AdvanceConfigGeneration(*db);
            transaction.Commit();
            AnnounceCommit(m_storeFile, generation);
            std::lock_guard guard(m_lock);
            m_changes.erase(m_changes.begin(), m_changes.begin() + std::ptrdiff_t(changes.size()));
        });
    }

private:
    struct Change
    {
        QString level;
        QString name;
        std::optional<std::uint32_t> state; // nothing: not optimized
    };

    static QString Name(const cv::rovo::PropertyRecord *property)
    {
        const QString name = ToQString(Required(property, "the property record").name);
        if (name.isEmpty())
            Bad(status::InvalidArgument, QStringLiteral("the property record has no name"));
        return name;
    }

    static QString Argument(const Change &change)
    {
        QJsonObject argument{{field::Level, change.level}, {field::Property, change.name}};
        if (change.state)
            argument.insert(field::State, qint64(*change.state));
        return QString::fromUtf8(QJsonDocument(argument).toJson(QJsonDocument::Compact));
    }

    // The last change of a property is the one that counts.
    void Record(QString level, QString name, std::optional<std::uint32_t> state)
    {
        std::lock_guard guard(m_lock);
        const auto same = std::find_if(m_changes.begin(), m_changes.end(), [&](const Change &change) {
            return change.level == level && change.name == name;
        });
        if (same != m_changes.end())
            m_changes.erase(same);
        m_changes.push_back({std::move(level), std::move(name), state});
    }

    const QString m_storeFile;
    std::mutex m_lock;
    std::vector<Change> m_changes; // recorded, not yet committed
};

} // namespace

QString RequireLevelKey(const WString &level)
{
    const QString key = ToQString(level);
    for (const char *known : kLevelKeys) {
        if (key.compare(QLatin1String(known), Qt::CaseInsensitive) == 0)
            return QLatin1String(known);
    }
    Bad(status::NotFound, QStringLiteral("there is no property level \"%1\" (levels: sorvik_root, qdm_channelgroup, "
                                         "qdm_channel)")
                              .arg(key));
}

cv::rovo::IPropertyModel *NewPropertyModel(const Instance &instance)
{
    const QJsonArray answer =
        Array(instance.Ask(QJsonObject{{manager::kOp, manager::op::PropertyModel}}), field::Levels, "its property model");
    std::vector<PropertyModel::Level> levels;
    for (const QJsonValue &item : answer) {
        const QJsonObject level = item.toObject();
        if (!level.value(field::Name).isString() || !level.value(field::DisplayNames).isObject())
            Unreadable("its property model");
        PropertyModel::Level described{level.value(field::Name).toString(), {}};
        const QJsonObject names = level.value(field::DisplayNames).toObject();
        for (auto it = names.begin(); it != names.end(); ++it)
            described.displayNames.emplace(it.key(), it.value().toString());
        levels.push_back(std::move(described));
    }
    return new PropertyModel(std::move(levels));
}

cv::rovo::ILevelPropertyList *NewLevelPropertyList(std::shared_ptr<const Instance> instance, QString levelKey)
{
    return new LevelPropertyList(std::move(instance), std::move(levelKey));
}

cv::rovo::IIndexStatus *NewIndexStatus(std::shared_ptr<const Instance> instance)
{
    return new IndexStatus(std::move(instance));
}

cv::rovo::IOptimizationEditor *NewOptimizationEditor(QString storeFile)
{
    return new OptimizationEditor(std::move(storeFile));
}

} // namespace sorvik::rovo
