#include "reference/vekex/catalogue.h"

#include "reference/libsupport/refobject.h"
#include "sorvik/vekex.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QSet>
#include <QXmlStreamReader>

#include <dlfcn.h>

namespace sorvik::vekex {

namespace {

constexpr qint64 kMaxCatalogueBytes = 4 * 1024 * 1024;
constexpr qint64 kMaxIconBytes = 256 * 1024;

std::u16string U16(const QString &text)
{
    return text.toStdU16String();
}

[[noreturn]] void Unreadable(const QString &text)
{
    ref::Fail(cv::vekex::status::CatalogueUnreadable, U16(text));
}

class Parser
{
public:
    Parser(const QString &path, const QByteArray &bytes) : m_path(path), m_xml(bytes) {}

    std::shared_ptr<Catalogue> Parse()
    {
        auto catalogue = std::make_shared<Catalogue>();
        catalogue->path = m_path;
        if (!NextElement())
            Malformed(QStringLiteral("no root element"));
        if (m_xml.name() != u"parselets")
            Malformed(QStringLiteral("the root element is <%1>, expected <parselets>").arg(m_xml.name()));
        CheckAttributes({QStringLiteral("format")});
        if (m_xml.attributes().value(QLatin1String("format")) != u"1")
            Malformed(QStringLiteral("unsupported catalogue format \"%1\", expected \"1\"")
                          .arg(m_xml.attributes().value(QLatin1String("format"))));

        QSet<QString> names;
        while (NextElement()) {
            if (m_xml.name() != u"parselet")
                Malformed(QStringLiteral("unexpected element <%1> in <parselets>").arg(m_xml.name()));
            StoreType type = ParseParselet();
            const QString key = type.name.toCaseFolded();
            if (names.contains(key))
                Malformed(QStringLiteral("the Parselet name \"%1\" appears twice").arg(type.name));
            names.insert(key);
            catalogue->types.push_back(std::move(type));
        }
        // Anything after the root element, or an unfinished document.
        while (!m_xml.atEnd() && !m_xml.hasError())
            m_xml.readNext();
        if (m_xml.hasError())
            Malformed(m_xml.errorString());
        return catalogue;
    }

private:
    // Moves to the next start element within the current one; false at its end.
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
                    Malformed(QStringLiteral("unexpected text \"%1\"").arg(m_xml.text().trimmed()));
                break;
            default:
                break;
            }
        }
        if (m_xml.hasError())
            Malformed(m_xml.errorString());
        return false;
    }

    void CheckAttributes(std::initializer_list<QString> allowed)
    {
        for (const QXmlStreamAttribute &attribute : m_xml.attributes()) {
            bool known = false;
            for (const QString &name : allowed)
                known = known || attribute.name() == name;
            if (!known)
                Malformed(QStringLiteral("unknown attribute \"%1\" of <%2>").arg(attribute.name(), m_xml.name()));
        }
    }

    QString Required(const QString &name)
    {
        if (!m_xml.attributes().hasAttribute(name))
            Malformed(QStringLiteral("<%1> lacks the attribute \"%2\"").arg(m_xml.name(), name));
        const QString value = m_xml.attributes().value(name).toString();
        if (value.trimmed().isEmpty() || value.trimmed() != value)
            Malformed(QStringLiteral("the attribute \"%1\" of <%2> is empty or has surrounding blanks")
                          .arg(name, m_xml.name()));
        return value;
    }

    bool Flag(const QString &name, bool fallback)
    {
        if (!m_xml.attributes().hasAttribute(name))
            return fallback;
        const QStringView value = m_xml.attributes().value(name);
        if (value == u"1" || value == u"true")
            return true;
        if (value == u"0" || value == u"false")
            return false;
        Malformed(QStringLiteral("the attribute \"%1\" must be 0 or 1, not \"%2\"").arg(name, value));
    }

    StoreType ParseParselet()
    {
        CheckAttributes({QStringLiteral("name"), QStringLiteral("model"), QStringLiteral("system"),
                         QStringLiteral("importsupported"), QStringLiteral("description"), QStringLiteral("icon")});
        StoreType type;
        type.name = Required(QStringLiteral("name"));
        type.model = Required(QStringLiteral("model"));
        type.system = Flag(QStringLiteral("system"), false);
        type.importSupported = Flag(QStringLiteral("importsupported"), true);
        type.description = m_xml.attributes().value(QLatin1String("description")).toString();
        if (m_xml.attributes().hasAttribute(QLatin1String("icon"))) {
            type.iconFile = Required(QStringLiteral("icon"));
            type.icon = ReadIcon(type.iconFile, type.name);
        }

        QSet<QString> extensions;
        while (NextElement()) {
            if (m_xml.name() != u"filefilter")
                Malformed(QStringLiteral("unexpected element <%1> in <parselet>").arg(m_xml.name()));
            CheckAttributes({QStringLiteral("extension"), QStringLiteral("userdefined")});
            FileFilter filter;
            filter.extension = Required(QStringLiteral("extension"));
            filter.userDefined = Flag(QStringLiteral("userdefined"), false);
            CheckExtension(filter.extension);
            const QString key = filter.extension.toCaseFolded();
            if (extensions.contains(key))
                Malformed(QStringLiteral("the Parselet \"%1\" names the extension \"%2\" twice")
                              .arg(type.name, filter.extension));
            extensions.insert(key);
            if (NextElement())
                Malformed(QStringLiteral("<filefilter> has no child elements"));
            type.filters.push_back(std::move(filter));
        }
        return type;
    }

    void CheckExtension(const QString &extension)
    {
        static const QString forbidden = QStringLiteral("*?/\\;,:|<>\"");
        for (QChar c : extension) {
            if (c.isSpace() || forbidden.contains(c) || c.unicode() < 0x20)
                Malformed(QStringLiteral("the extension \"%1\" holds the character '%2'").arg(extension, c));
        }
        if (extension.startsWith(u'.') || extension.endsWith(u'.'))
            Malformed(QStringLiteral("the extension \"%1\" starts or ends with a dot").arg(extension));
    }

    QByteArray ReadIcon(const QString &iconFile, const QString &parselet)
    {
        const QString path = QFileInfo(m_path).absoluteDir().absoluteFilePath(iconFile);
        // A device or pipe would report size 0 and never end.
        if (!QFileInfo(path).isFile())
            Unreadable(QStringLiteral("%1: the icon %2 of the Parselet \"%3\" is not a file").arg(m_path, path, parselet));
        QFile file(path);
        if (!file.open(QIODevice::ReadOnly))
            Unreadable(QStringLiteral("%1: the icon %2 of the Parselet \"%3\" cannot be read: %4")
                           .arg(m_path, path, parselet, file.errorString()));
        QByteArray bytes = file.read(kMaxIconBytes + 1);
        if (bytes.size() > kMaxIconBytes)
            Unreadable(QStringLiteral("%1: the icon %2 of the Parselet \"%3\" is larger than %4 bytes")
                           .arg(m_path, path, parselet)
                           .arg(kMaxIconBytes));
        if (file.error() != QFileDevice::NoError || bytes.size() != file.size())
            Unreadable(QStringLiteral("%1: the icon %2 cannot be read in full").arg(m_path, path));
        return bytes;
    }

    [[noreturn]] void Malformed(const QString &what)
    {
        ref::Fail(cv::vekex::status::CatalogueMalformed,
                  U16(QStringLiteral("%1:%2:%3: %4")
                          .arg(m_path)
                          .arg(m_xml.lineNumber())
                          .arg(m_xml.columnNumber())
                          .arg(what)));
    }

    QString m_path;
    QXmlStreamReader m_xml;
};

void Anchor() {}

} // namespace

bool StoreType::ReadsExtension(const QString &extension) const
{
    for (const FileFilter &filter : filters) {
        if (filter.extension.compare(extension, Qt::CaseInsensitive) == 0)
            return true;
    }
    return false;
}

const StoreType *Catalogue::Find(const QString &name) const
{
    for (const StoreType &type : types) {
        if (type.name.compare(name, Qt::CaseInsensitive) == 0)
            return &type;
    }
    return nullptr;
}

QString CataloguePath()
{
    const QString overridden = qEnvironmentVariable("CORVANE_VEKEX_CATALOGUE");
    if (!overridden.isEmpty())
        return overridden;
    Dl_info info{};
    if (dladdr(reinterpret_cast<void *>(&Anchor), &info) == 0 || !info.dli_fname)
        Unreadable(QStringLiteral("the folder of the data-store library cannot be determined"));
    return QFileInfo(QFile::decodeName(info.dli_fname)).absoluteDir().absoluteFilePath(
        QStringLiteral("vekex-parselets.xml"));
}

std::shared_ptr<const Catalogue> LoadCatalogue(const QString &path)
{
    QFile file(path);
    if (!file.open(QIODevice::ReadOnly))
        Unreadable(QStringLiteral("the Parselet catalogue %1 cannot be read: %2").arg(path, file.errorString()));
    if (file.size() > kMaxCatalogueBytes)
        Unreadable(QStringLiteral("the Parselet catalogue %1 is larger than %2 bytes").arg(path).arg(kMaxCatalogueBytes));
    const QByteArray bytes = file.read(kMaxCatalogueBytes + 1);
    if (file.error() != QFileDevice::NoError)
        Unreadable(QStringLiteral("the Parselet catalogue %1 cannot be read: %2").arg(path, file.errorString()));
    return ParseCatalogue(path, bytes);
}

std::shared_ptr<const Catalogue> ParseCatalogue(const QString &path, const QByteArray &bytes)
{
    if (bytes.size() > kMaxCatalogueBytes)
        Unreadable(QStringLiteral("the Parselet catalogue %1 is larger than %2 bytes").arg(path).arg(kMaxCatalogueBytes));
    return Parser(path, bytes).Parse();
}

} // namespace sorvik::vekex
