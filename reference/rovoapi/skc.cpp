#include "reference/rovoapi/skc.h"

#include "reference/libsupport/refobject.h"

#include <QFile>
#include <QSaveFile>
#include <QSet>
#include <QXmlStreamReader>
#include <QXmlStreamWriter>

namespace sorvik::rovo {

namespace status = cv::rovo::status;

namespace {

constexpr qint64 kMaxFileBytes = 16 * 1024 * 1024;

class Reader
{
public:
    Reader(const QString &file, const QByteArray &bytes, const CatalogueInfo &catalogue)
        : m_file(file), m_xml(bytes), m_catalogue(catalogue)
    {
    }

    Configuration Read()
    {
        Configuration configuration;
        if (!NextElement() || m_xml.name() != u"sorvikconfiguration")
            Malformed(QStringLiteral("the root element must be <sorvikconfiguration>"));
        Attributes({QStringLiteral("format")});
        if (Required(QStringLiteral("format")) != u"1")
            Malformed(QStringLiteral("unsupported format, this library reads format 1"));

        bool areas = false, indexer = false, advanced = false, parselets = false, extensions = false;
        while (NextElement()) {
            const QString name = m_xml.name().toString();
            if (name == u"searchareas" && !std::exchange(areas, true))
                ReadAreas(configuration);
            else if (name == u"indexer" && !std::exchange(indexer, true))
                ReadIndexer(configuration.settings);
            else if (name == u"advanced" && !std::exchange(advanced, true))
                ReadAdvanced(configuration.settings);
            else if (name == u"parselets" && !std::exchange(parselets, true))
                ReadParselets(configuration);
            else if (name == u"extensions" && !std::exchange(extensions, true))
                ReadExtensions(configuration);
            else
                Malformed(QStringLiteral("unexpected or repeated element <%1>").arg(name));
        }
        if (!indexer || !advanced)
            Malformed(QStringLiteral("<indexer> and <advanced> are required"));
        while (!m_xml.atEnd())
            m_xml.readNext();
        if (m_xml.hasError())
            Malformed(m_xml.errorString());
        CheckSettings(configuration.settings, status::FileMalformed);
        return configuration;
    }

private:
    bool NextElement()
    {
        while (!m_xml.atEnd()) {
            switch (m_xml.readNext()) {
            case QXmlStreamReader::StartElement:
                return true;
            case QXmlStreamReader::EndElement:
                return false;
            case QXmlStreamReader::Characters:
                if (!m_xml.isWhitespace())
                    Malformed(QStringLiteral("unexpected text"));
                break;
            default:
                break;
            }
        }
        if (m_xml.hasError())
            Malformed(m_xml.errorString());
        Malformed(QStringLiteral("the file ends early"));
    }

    void NoChildren()
    {
        if (NextElement())
            Malformed(QStringLiteral("<%1> is not expected here").arg(m_xml.name()));
    }

    void Attributes(std::initializer_list<QString> allowed)
    {
        for (const QXmlStreamAttribute &attribute : m_xml.attributes()) {
            if (std::find(allowed.begin(), allowed.end(), attribute.name()) == allowed.end())
                Malformed(QStringLiteral("unknown attribute \"%1\" of <%2>").arg(attribute.name(), m_xml.name()));
        }
    }

    QString Optional(const QString &name) const { return m_xml.attributes().value(name).toString(); }

    QString Required(const QString &name)
    {
        if (!m_xml.attributes().hasAttribute(name))
            Malformed(QStringLiteral("<%1> lacks the attribute \"%2\"").arg(m_xml.name(), name));
        return Optional(name);
    }

    std::uint32_t Unsigned(const QString &name)
    {
        bool ok = false;
        const qulonglong value = Required(name).toULongLong(&ok);
        if (!ok || value > 0xFFFFFFFFull)
            Malformed(QStringLiteral("the attribute \"%1\" is not a number").arg(name));
        return std::uint32_t(value);
    }

    std::int32_t Signed(const QString &name)
    {
        bool ok = false;
        const int value = Required(name).toInt(&ok);
        if (!ok)
            Malformed(QStringLiteral("the attribute \"%1\" is not a number").arg(name));
        return value;
    }

    Folder ReadFolder(bool area)
    {
        Attributes({QStringLiteral("path"), QStringLiteral("clientpath"), QStringLiteral("alias"), QStringLiteral("tag")});
        Folder folder;
        folder.path = Checked(Required(QStringLiteral("path")));
        const QString client = Optional(QStringLiteral("clientpath"));
        folder.clientPath = client.isEmpty() ? client : Checked(client);
        folder.alias = area ? Required(QStringLiteral("alias")) : Optional(QStringLiteral("alias"));
        if (area && folder.alias.trimmed().isEmpty())
            Malformed(QStringLiteral("the search area %1 has an empty alias").arg(folder.path));
        folder.tag = Optional(QStringLiteral("tag"));
        if (m_paths.contains(Key(folder.path)))
            Malformed(QStringLiteral("the path %1 appears twice").arg(folder.path));
        m_paths.insert(Key(folder.path));
        return folder;
    }

    QString Checked(const QString &path)
    {
        try {
            return NormalizePath(path, u"path", status::FileMalformed);
        } catch (const ref::Failure &failure) {
            Malformed(QString::fromStdU16String(failure.text));
        }
    }

    void ReadAreas(Configuration &configuration)
    {
        Attributes({});
        QSet<QString> aliases;
        while (NextElement()) {
            if (m_xml.name() != u"searcharea")
                Malformed(QStringLiteral("unexpected element <%1> in <searchareas>").arg(m_xml.name()));
            SearchArea area;
            static_cast<Folder &>(area) = ReadFolder(true);
            if (aliases.contains(Key(area.alias)))
                Malformed(QStringLiteral("the alias \"%1\" appears twice").arg(area.alias));
            aliases.insert(Key(area.alias));
            for (const SearchArea &other : configuration.areas) {
                if (IsInside(area.path, other.path) || IsInside(other.path, area.path))
                    Malformed(QStringLiteral("the search areas %1 and %2 lie inside each other").arg(area.path, other.path));
            }
            while (NextElement()) {
                if (m_xml.name() != u"excludedfolder")
                    Malformed(QStringLiteral("unexpected element <%1> in <searcharea>").arg(m_xml.name()));
                Folder folder = ReadFolder(false);
                if (!IsInside(folder.path, area.path) || Key(folder.path) == Key(area.path))
                    Malformed(QStringLiteral("the excluded folder %1 does not lie inside %2").arg(folder.path, area.path));
                NoChildren();
                area.excluded.push_back(std::move(folder));
            }
            configuration.areas.push_back(std::move(area));
        }
    }

    void ReadIndexer(Settings &settings)
    {
        Attributes({QStringLiteral("idletime"), QStringLiteral("filetimeout"), QStringLiteral("changetrigger"),
                    QStringLiteral("triggerscope"), QStringLiteral("triggerevents"), QStringLiteral("schedulekind"),
                    QStringLiteral("scheduletime")});
        settings.idleTime = Unsigned(QStringLiteral("idletime"));
        settings.fileTimeout = Unsigned(QStringLiteral("filetimeout"));
        settings.changeTrigger = Signed(QStringLiteral("changetrigger"));
        settings.triggerScope = Signed(QStringLiteral("triggerscope"));
        settings.triggerEvents = Signed(QStringLiteral("triggerevents"));
        settings.scheduleKind = Signed(QStringLiteral("schedulekind"));
        if (!ParseTime(Required(QStringLiteral("scheduletime")), &settings.scheduleTime))
            Malformed(QStringLiteral("the schedule time is not written as yyyy-MM-ddTHH:mm:ssZ"));
        NoChildren();
    }

    void ReadAdvanced(Settings &settings)
    {
        Attributes({QStringLiteral("browsetimeout"), QStringLiteral("querytimeout"), QStringLiteral("indexpath")});
        settings.browseTimeout = Unsigned(QStringLiteral("browsetimeout"));
        settings.queryTimeout = Unsigned(QStringLiteral("querytimeout"));
        settings.indexPath = Checked(Required(QStringLiteral("indexpath")));
        NoChildren();
    }

    QString Parselet()
    {
        const QString name = Required(QStringLiteral("name"));
        const ParseletInfo *parselet = m_catalogue.Find(name);
        if (!parselet)
            Malformed(QStringLiteral("there is no Parselet \"%1\" on this machine").arg(name));
        return parselet->name;
    }

    void ReadParselets(Configuration &configuration)
    {
        Attributes({});
        QSet<QString> seen;
        while (NextElement()) {
            if (m_xml.name() != u"parselet")
                Malformed(QStringLiteral("unexpected element <%1> in <parselets>").arg(m_xml.name()));
            Attributes({QStringLiteral("name"), QStringLiteral("active")});
            ParseletSetting setting;
            setting.name = Parselet();
            const QString active = Required(QStringLiteral("active"));
            if (active != u"0" && active != u"1")
                Malformed(QStringLiteral("the attribute \"active\" must be 0 or 1"));
            setting.active = active == u"1";
            if (seen.contains(Key(setting.name)))
                Malformed(QStringLiteral("the Parselet %1 appears twice").arg(setting.name));
            seen.insert(Key(setting.name));
            NoChildren();
            configuration.parselets.push_back(std::move(setting));
        }
    }

    void ReadExtensions(Configuration &configuration)
    {
        Attributes({});
        QSet<QString> seen;
        while (NextElement()) {
            if (m_xml.name() != u"extension")
                Malformed(QStringLiteral("unexpected element <%1> in <extensions>").arg(m_xml.name()));
            Attributes({QStringLiteral("name")});
            ExtensionPriority priority;
            priority.extension = Key(Required(QStringLiteral("name")));
            if (priority.extension.isEmpty() || seen.contains(priority.extension))
                Malformed(QStringLiteral("the extension \"%1\" is empty or appears twice").arg(priority.extension));
            seen.insert(priority.extension);
            while (NextElement()) {
                if (m_xml.name() != u"parselet")
                    Malformed(QStringLiteral("unexpected element <%1> in <extension>").arg(m_xml.name()));
                Attributes({QStringLiteral("name")});
                const QString name = Parselet();
                if (!m_catalogue.Find(name)->Reads(priority.extension))
                    Malformed(QStringLiteral("the Parselet %1 does not read *.%2").arg(name, priority.extension));
                if (std::find(priority.parselets.begin(), priority.parselets.end(), name) != priority.parselets.end())
                    Malformed(QStringLiteral("the Parselet %1 appears twice for *.%2").arg(name, priority.extension));
                NoChildren();
                priority.parselets.push_back(name);
            }
            configuration.priorities.push_back(std::move(priority));
        }
    }

    [[noreturn]] void Malformed(const QString &what)
    {
        ref::Fail(status::FileMalformed, QStringLiteral("%1:%2:%3: %4")
                                             .arg(m_file)
                                             .arg(m_xml.lineNumber())
                                             .arg(m_xml.columnNumber())
                                             .arg(what)
                                             .toStdU16String());
    }

    QString m_file;
    QXmlStreamReader m_xml;
    const CatalogueInfo &m_catalogue;
    QSet<QString> m_paths;
};

void WriteFolder(QXmlStreamWriter &xml, const Folder &folder)
{
    xml.writeAttribute(QStringLiteral("path"), folder.path);
    xml.writeAttribute(QStringLiteral("clientpath"), folder.clientPath);
    xml.writeAttribute(QStringLiteral("alias"), folder.alias);
    xml.writeAttribute(QStringLiteral("tag"), folder.tag);
}

void WriteConfiguration(QXmlStreamWriter &xml, const Configuration &configuration)
{
    xml.setAutoFormatting(true);
    xml.writeStartDocument();
    xml.writeStartElement(QStringLiteral("sorvikconfiguration"));
    xml.writeAttribute(QStringLiteral("format"), QStringLiteral("1"));

    xml.writeStartElement(QStringLiteral("searchareas"));
    for (const SearchArea &area : configuration.areas) {
        xml.writeStartElement(QStringLiteral("searcharea"));
        WriteFolder(xml, area);
        for (const Folder &folder : area.excluded) {
            xml.writeStartElement(QStringLiteral("excludedfolder"));
            WriteFolder(xml, folder);
            xml.writeEndElement();
        }
        xml.writeEndElement();
    }
    xml.writeEndElement();

    const Settings &settings = configuration.settings;
    xml.writeStartElement(QStringLiteral("indexer"));
    xml.writeAttribute(QStringLiteral("idletime"), QString::number(settings.idleTime));
    xml.writeAttribute(QStringLiteral("filetimeout"), QString::number(settings.fileTimeout));
    xml.writeAttribute(QStringLiteral("changetrigger"), QString::number(settings.changeTrigger));
    xml.writeAttribute(QStringLiteral("triggerscope"), QString::number(settings.triggerScope));
    xml.writeAttribute(QStringLiteral("triggerevents"), QString::number(settings.triggerEvents));
    xml.writeAttribute(QStringLiteral("schedulekind"), QString::number(settings.scheduleKind));
    xml.writeAttribute(QStringLiteral("scheduletime"), FormatTime(settings.scheduleTime));
    xml.writeEndElement();

    xml.writeStartElement(QStringLiteral("advanced"));
    xml.writeAttribute(QStringLiteral("browsetimeout"), QString::number(settings.browseTimeout));
    xml.writeAttribute(QStringLiteral("querytimeout"), QString::number(settings.queryTimeout));
    xml.writeAttribute(QStringLiteral("indexpath"), settings.indexPath);
    xml.writeEndElement();

    xml.writeStartElement(QStringLiteral("parselets"));
    for (const ParseletSetting &parselet : configuration.parselets) {
        xml.writeStartElement(QStringLiteral("parselet"));
        xml.writeAttribute(QStringLiteral("name"), parselet.name);
        xml.writeAttribute(QStringLiteral("active"), parselet.active ? QStringLiteral("1") : QStringLiteral("0"));
        xml.writeEndElement();
    }
    xml.writeEndElement();

    xml.writeStartElement(QStringLiteral("extensions"));
    for (const ExtensionPriority &priority : configuration.priorities) {
        xml.writeStartElement(QStringLiteral("extension"));
        xml.writeAttribute(QStringLiteral("name"), priority.extension);
        for (const QString &name : priority.parselets) {
            xml.writeStartElement(QStringLiteral("parselet"));
            xml.writeAttribute(QStringLiteral("name"), name);
            xml.writeEndElement();
        }
        xml.writeEndElement();
    }
    xml.writeEndElement();

    xml.writeEndElement();
    xml.writeEndDocument();
}

} // namespace

Configuration ReadConfigurationFile(const QString &file, const CatalogueInfo &catalogue)
{
    QFile input(file);
    if (!input.open(QIODevice::ReadOnly))
        ref::Fail(status::FileUnreadable,
                  QStringLiteral("%1 cannot be read: %2").arg(file, input.errorString()).toStdU16String());
    if (input.size() > kMaxFileBytes)
        ref::Fail(status::FileMalformed,
                  QStringLiteral("%1 is larger than %2 bytes").arg(file).arg(kMaxFileBytes).toStdU16String());
    const QByteArray bytes = input.read(kMaxFileBytes + 1);
    if (input.error() != QFileDevice::NoError)
        ref::Fail(status::FileUnreadable,
                  QStringLiteral("%1 cannot be read: %2").arg(file, input.errorString()).toStdU16String());
    return ParseConfiguration(file, bytes, catalogue);
}

Configuration ParseConfiguration(const QString &file, const QByteArray &bytes, const CatalogueInfo &catalogue)
{
    if (bytes.size() > kMaxFileBytes)
        ref::Fail(status::FileMalformed,
                  QStringLiteral("%1 is larger than %2 bytes").arg(file).arg(kMaxFileBytes).toStdU16String());
    return Reader(file, bytes, catalogue).Read();
}

QByteArray SerializeConfiguration(const Configuration &configuration)
{
    QByteArray bytes;
    QXmlStreamWriter xml(&bytes);
    WriteConfiguration(xml, configuration);
    return bytes;
}

void WriteConfigurationFile(const QString &file, const Configuration &configuration)
{
    const QByteArray bytes = SerializeConfiguration(configuration);
    // Unbuffered, so that a write cut short (a full disk) shows in its count:
    // through the buffer it went unnoticed and half a file replaced the old.
    QSaveFile output(file);
    const bool written = output.open(QIODevice::WriteOnly | QIODevice::Unbuffered)
        && output.write(bytes) == bytes.size();
    const QString error = output.errorString();
    if (!written)
        output.cancelWriting();
    if (!written || !output.commit())
        ref::Fail(status::FileWriteFailed,
                  QStringLiteral("%1 cannot be written: %2").arg(file, written ? output.errorString() : error)
                      .toStdU16String());
}

} // namespace sorvik::rovo
