// Every entry of the string table: there, translatable, with placeholders a
// translator can follow, and filled in without touching the arguments.

#include "resources/strings.h"

#include <QCoreApplication>
#include <QRegularExpression>

#include <gtest/gtest.h>

namespace {

using resources::FormatString;
using resources::LoadString;
using resources::SourceText;
using resources::Str;

// The placeholder numbers of a text, in order of appearance.
std::vector<int> Placeholders(const QString &text)
{
    std::vector<int> numbers;
    static const QRegularExpression placeholder(QStringLiteral("%(\\d)[sd]?"));
    for (const QRegularExpressionMatch &m : placeholder.globalMatch(text))
        numbers.push_back(m.captured(1).toInt());
    return numbers;
}

TEST(StringTable, EveryEntryIsTranslatableTextWithNumberedPlaceholders)
{
    for (int i = 0; i < int(Str::Count); ++i) {
        const auto id = Str(i);
        const QString text = LoadString(id);
        SCOPED_TRACE(text.toStdString());
        EXPECT_FALSE(text.trimmed().isEmpty()) << "entry " << i;
        EXPECT_EQ(text, QString::fromUtf8(SourceText(id))) << "without a translation the source text shows";
        EXPECT_LE(text.count(u'&') - 2 * text.count(QStringLiteral("&&")), 1) << "one mnemonic at most";

        // Every % is a placeholder %N, %Ns or %Nd, numbered 1, 2, ... without gaps.
        EXPECT_EQ(text.count(u'%'), qsizetype(Placeholders(text).size())) << "a stray %";
        std::vector<int> numbers = Placeholders(text);
        std::sort(numbers.begin(), numbers.end());
        numbers.erase(std::unique(numbers.begin(), numbers.end()), numbers.end());
        for (std::size_t n = 0; n < numbers.size(); ++n)
            EXPECT_EQ(numbers[n], int(n + 1));

        QStringList arguments;
        for (std::size_t n = 0; n < numbers.size(); ++n)
            arguments << QStringLiteral("<%1%>").arg(n);
        QString filled = text;
        if (!numbers.empty()) {
            filled = arguments.size() == 1 ? FormatString(id, arguments[0])
                                           : FormatString(id, {arguments.value(0), arguments.value(1)});
        }
        for (const QString &argument : arguments)
            EXPECT_TRUE(filled.contains(argument));
        EXPECT_TRUE(Placeholders(filled).empty()) << filled.toStdString();
    }
}

TEST(StringTable, FormattingTakesArgumentsLiterallyAndInTheirOrder)
{
    EXPECT_EQ(FormatString(Str::EnterIntegerBetween, {QStringLiteral("0"), QStringLiteral("9999")}),
              QStringLiteral("Enter an integer between 0 and 9999."));
    EXPECT_EQ(FormatString(Str::NameExists, QStringLiteral("100%1d")),
              QStringLiteral("An element with the name 100%1d already exists."))
        << "an argument's own % signs stay";
    EXPECT_EQ(FormatString(Str::EnterIntegerBetween, {QStringLiteral("5")}),
              QStringLiteral("Enter an integer between 5 and %2d."))
        << "a missing argument leaves its placeholder";
}

} // namespace
