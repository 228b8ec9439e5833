#pragma once

// An animation control: plays a looping animation of the module's
// resources on a transparent background.

#include <QLabel>

#include <memory>

class QMovie;

namespace sharedsource {

class ToAnimation final : public QLabel
{
    Q_OBJECT

public:
    explicit ToAnimation(QWidget *parent = nullptr);
    ~ToAnimation() override;

    // ":/sorvik/animations/<name>"; false when it cannot be read.
    bool Open(const QString &name);
    // From the first frame to the last, repeating without end; false when
    // nothing is open.
    bool Play();
    void Stop();
    bool IsPlaying() const;
    // Frames shown since Play, for tests and diagnostics.
    int FramesShown() const { return m_framesShown; }

    static QString ResourcePath(const QString &name);

private:
    std::unique_ptr<QMovie> m_movie;
    int m_framesShown = 0;
};

} // namespace sharedsource
