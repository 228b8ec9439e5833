#include "reference/rovoapi/connection.h"

#include "reference/libsupport/refobject.h"
#include "sorvik/rovoapi.h"

namespace sorvik::rovo {

namespace {

class Scanner
{
public:
    explicit Scanner(const QString &text) : m_text(text) {}

    Connection Parse()
    {
        Connection connection;
        bool seenName = false, seenPort = false, seenServer = false, seenType = false;
        for (SkipBlanks(); m_pos < m_text.size(); SkipBlanks()) {
            if (m_text[m_pos] != u'<')
                Invalid(QStringLiteral("an element must start with '<'"));
            ++m_pos;
            const qsizetype tagStart = m_pos;
            while (m_pos < m_text.size() && !IsTagEnd(m_text[m_pos]))
                ++m_pos;
            const QString tag = m_text.mid(tagStart, m_pos - tagStart);
            if (tag.isEmpty() || tag.startsWith(u'/'))
                Invalid(QStringLiteral("an element name is missing"));
            const qsizetype close = m_text.indexOf(u'>', m_pos);
            if (close < 0)
                Invalid(QStringLiteral("the start tag of <%1> is not closed").arg(tag));
            m_pos = close + 1;
            const QString endTag = QStringLiteral("</") + tag + u'>';
            const qsizetype end = m_text.indexOf(endTag, m_pos);
            if (end < 0)
                Invalid(QStringLiteral("<%1> has no end tag").arg(tag));
            const QString value = Decode(m_text.mid(m_pos, end - m_pos));
            m_pos = end + endTag.size();

            // The first occurrence of an element counts.
            if (tag == u"Name" && !std::exchange(seenName, true))
                connection.name = value;
            else if (tag == u"PortName" && !std::exchange(seenPort, true))
                connection.portName = value;
            else if (tag == u"Server" && !std::exchange(seenServer, true))
                connection.server = value;
            else if (tag == u"SorvikType" && !std::exchange(seenType, true))
                connection.sorvikType = value;
        }
        return connection;
    }

private:
    static bool IsTagEnd(QChar c) { return c == u' ' || c == u'\t' || c == u'\n' || c == u'\r' || c == u'>'; }

    void SkipBlanks()
    {
        while (m_pos < m_text.size() && m_text[m_pos].isSpace())
            ++m_pos;
    }

    QString Decode(const QString &raw)
    {
        QString value;
        for (qsizetype i = 0; i < raw.size(); ++i) {
            if (raw[i] != u'&') {
                value += raw[i];
                continue;
            }
            static const std::pair<const char16_t *, QChar> entities[] = {
                {u"&amp;", u'&'}, {u"&lt;", u'<'}, {u"&gt;", u'>'}, {u"&quot;", u'"'}, {u"&apos;", u'\''}};
            bool known = false;
            for (const auto &[entity, character] : entities) {
                const QStringView text(entity);
                if (QStringView(raw).mid(i).startsWith(text)) {
                    value += character;
                    i += text.size() - 1;
                    known = true;
                    break;
                }
            }
            if (!known)
                Invalid(QStringLiteral("an unknown entity in a value"));
        }
        return value;
    }

    [[noreturn]] void Invalid(const QString &what)
    {
        ref::Fail(cv::rovo::status::InvalidConnection,
                  QStringLiteral("connection text, position %1: %2").arg(m_pos).arg(what).toStdU16String());
    }

    const QString &m_text;
    qsizetype m_pos = 0;
};

} // namespace

Connection ParseConnection(const QString &text)
{
    return Scanner(text).Parse();
}

} // namespace sorvik::rovo
