#include "krn/osdep/inifile.h"

#include "krn/utf.h"

#include <QString>

#include <cerrno>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace cv::krn::osdep {

namespace {

bool IsBlank(char16_t c)
{
    return c == u' ' || c == u'\t' || c == u'\r' || c == u'\v' || c == u'\f';
}

std::u16string_view Trim(std::u16string_view text)
{
    while (!text.empty() && IsBlank(text.front()))
        text.remove_prefix(1);
    while (!text.empty() && IsBlank(text.back()))
        text.remove_suffix(1);
    return text;
}

std::u16string Fold(std::u16string_view text)
{
    const std::u16string_view trimmed = Trim(text);
    const QString folded = QString::fromUtf16(trimmed.data(), static_cast<qsizetype>(trimmed.size())).toCaseFolded();
    return std::u16string(reinterpret_cast<const char16_t *>(folded.utf16()), static_cast<std::size_t>(folded.size()));
}

std::string_view WithoutByteOrderMark(std::string_view text)
{
    constexpr std::string_view kBom = "\xEF\xBB\xBF";
    if (text.substr(0, kBom.size()) == kBom)
        text.remove_prefix(kBom.size());
    return text;
}

// Only a regular file is read: a folder, FIFO or device (an environment
// variable pointing at the wrong thing) reads as missing rather than
// failing or blocking. A read error drops the whole file, never half of it.
std::optional<std::string> ReadRegularFile(const std::filesystem::path &path)
{
    const int fd = ::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK);
    if (fd < 0)
        return std::nullopt;
    struct stat status = {};
    std::optional<std::string> content;
    if (::fstat(fd, &status) == 0 && S_ISREG(status.st_mode)) {
        content.emplace();
        char buffer[8192];
        ssize_t count = 0;
        while ((count = ::read(fd, buffer, sizeof buffer)) != 0) {
            if (count < 0 && errno == EINTR)
                continue;
            if (count < 0) {
                content.reset();
                break;
            }
            content->append(buffer, static_cast<std::size_t>(count));
        }
    }
    ::close(fd);
    return content;
}

} // namespace

IniFile IniFile::Load(const std::filesystem::path &path)
{
    const std::optional<std::string> content = ReadRegularFile(path);
    return content ? Parse(*content) : IniFile();
}

IniFile IniFile::Parse(std::string_view utf8Text)
{
    IniFile file;
    const std::u16string text = ToUtf16(WithoutByteOrderMark(utf8Text));
    Section *current = nullptr;
    std::size_t start = 0;
    while (start <= text.size()) {
        std::size_t end = text.find(u'\n', start);
        if (end == std::u16string::npos)
            end = text.size();
        file.ParseLine(std::u16string_view(text).substr(start, end - start), current);
        start = end + 1;
    }
    return file;
}

void IniFile::ParseLine(std::u16string_view line, Section *&current)
{
    line = Trim(line);
    if (line.empty() || line.front() == u';' || line.front() == u'#')
        return;
    if (line.front() == u'[') {
        current = line.back() == u']' && line.size() >= 2
            ? &m_sections[Fold(line.substr(1, line.size() - 2))]
            : nullptr;
        return;
    }
    const std::size_t equals = line.find(u'=');
    if (!current || equals == std::u16string_view::npos)
        return;
    current->try_emplace(Fold(line.substr(0, equals)), Trim(line.substr(equals + 1)));
}

std::optional<std::u16string> IniFile::Value(std::u16string_view section, std::u16string_view name) const
{
    const auto sectionIt = m_sections.find(Fold(section));
    if (sectionIt == m_sections.end())
        return std::nullopt;
    const auto valueIt = sectionIt->second.find(Fold(name));
    if (valueIt == sectionIt->second.end())
        return std::nullopt;
    return valueIt->second;
}

std::optional<std::uint32_t> IniFile::UnsignedValue(std::u16string_view section, std::u16string_view name) const
{
    const std::optional<std::u16string> text = Value(section, name);
    if (!text || text->empty())
        return std::nullopt;
    std::uint64_t number = 0;
    for (const char16_t c : *text) {
        if (c < u'0' || c > u'9')
            return std::nullopt;
        number = number * 10 + static_cast<std::uint64_t>(c - u'0');
        if (number > 0xFFFFFFFFu)
            return std::nullopt;
    }
    return static_cast<std::uint32_t>(number);
}

} // namespace cv::krn::osdep
