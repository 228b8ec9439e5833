#include "reference/vekex/querypath.h"

#include "reference/libsupport/refobject.h"
#include "sorvik/vekex.h"

namespace sorvik::vekex {

namespace {

class Scanner
{
public:
    explicit Scanner(const QString &path) : m_path(path) {}

    QueryPath Parse()
    {
        QueryPath result;
        if (Take(u"/#")) {
            result.absolute = true;
            if (Identifier() != u"data_store_manager" || !Take(u".") || Identifier() != u"storetypes")
                Invalid(QStringLiteral("the only absolute path is /#data_store_manager.storetypes"));
            result.collection = QueryPath::Collection::StoreTypes;
        } else {
            if (Identifier() != u"filefilters")
                Invalid(QStringLiteral("the only relative path is filefilters"));
            result.collection = QueryPath::Collection::FileFilters;
        }
        if (Take(u"(")) {
            SkipBlanks();
            while (!Take(u")")) {
                if (AtEnd())
                    Invalid(QStringLiteral("the filter lacks its closing parenthesis"));
                QString attribute = Identifier();
                if (attribute.isEmpty())
                    Invalid(QStringLiteral("an attribute name is missing"));
                if (!Take(u"="))
                    Invalid(QStringLiteral("'=' is missing after %1").arg(attribute));
                QString value = Value();
                result.terms.emplace_back(std::move(attribute), std::move(value));
                const bool blank = SkipBlanks();
                if (!blank && !AtEnd() && m_path[m_pos] != u')')
                    Invalid(QStringLiteral("terms must be separated by blanks"));
            }
        }
        if (!AtEnd())
            Invalid(QStringLiteral("unexpected text after the path"));
        return result;
    }

private:
    bool AtEnd() const { return m_pos >= m_path.size(); }

    bool Take(QStringView text)
    {
        if (QStringView(m_path).mid(m_pos).startsWith(text)) {
            m_pos += text.size();
            return true;
        }
        return false;
    }

    bool SkipBlanks()
    {
        const qsizetype start = m_pos;
        while (!AtEnd() && m_path[m_pos].isSpace())
            ++m_pos;
        return m_pos != start;
    }

    QString Identifier()
    {
        const qsizetype start = m_pos;
        while (!AtEnd() && (m_path[m_pos].isLetterOrNumber() || m_path[m_pos] == u'_'))
            ++m_pos;
        return m_path.mid(start, m_pos - start);
    }

    QString Value()
    {
        if (Take(u"'")) {
            const qsizetype start = m_pos;
            for (; !AtEnd(); ++m_pos) {
                if (m_path[m_pos] != u'\'')
                    continue;
                const qsizetype next = m_pos + 1;
                if (next >= m_path.size() || m_path[next].isSpace() || m_path[next] == u')') {
                    QString value = m_path.mid(start, m_pos - start);
                    ++m_pos;
                    return value;
                }
            }
            Invalid(QStringLiteral("a quoted value is not closed"));
        }
        const qsizetype start = m_pos;
        while (!AtEnd() && !m_path[m_pos].isSpace() && m_path[m_pos] != u')' && m_path[m_pos] != u'\'')
            ++m_pos;
        if (m_pos == start)
            Invalid(QStringLiteral("a value is missing"));
        return m_path.mid(start, m_pos - start);
    }

    [[noreturn]] void Invalid(const QString &what)
    {
        ref::Fail(cv::vekex::status::InvalidQuery,
                  QStringLiteral("selection path \"%1\", position %2: %3").arg(m_path).arg(m_pos).arg(what)
                      .toStdU16String());
    }

    const QString &m_path;
    qsizetype m_pos = 0;
};

} // namespace

QueryPath ParseQueryPath(const QString &path)
{
    return Scanner(path).Parse();
}

} // namespace sorvik::vekex
