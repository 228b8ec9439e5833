#pragma once

#include <cstdint>
#include <exception>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

namespace cv::krn::exception {

// Root of the library's failure reports: a fixed description and code per
// class, plus where it was raised (line 0 and no file when not given).
//
// Texts are held behind shared pointers so that copying an exception, as the
// runtime may do while it propagates, never allocates or throws. what()
// returns the description the object was constructed with.
class Exception : public std::exception
{
public:
    Exception();
    Exception(std::string_view sourceFile, std::uint32_t sourceLine);
    ~Exception() override;

    virtual std::string Description() const;
    virtual std::uint32_t Code() const noexcept;

    const char *what() const noexcept override;
    std::uint32_t SourceLine() const noexcept { return m_sourceLine; }
    std::optional<std::string> SourceFile() const;

protected:
    // prefix + ": " + detail, the description of the detail variants.
    static std::string WithDetail(std::string_view prefix, std::string_view detail);

    explicit Exception(std::string description);
    Exception(std::string description, std::string_view sourceFile, std::uint32_t sourceLine);

private:
    std::shared_ptr<const std::string> m_description;
    std::shared_ptr<const std::string> m_sourceFile;
    std::uint32_t m_sourceLine = 0;
};

} // namespace cv::krn::exception
