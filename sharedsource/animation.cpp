#include "sharedsource/animation.h"

#include <QMovie>

namespace sharedsource {

ToAnimation::ToAnimation(QWidget *parent) : QLabel(parent)
{
    setAttribute(Qt::WA_TranslucentBackground);
    setAlignment(Qt::AlignCenter);
}

ToAnimation::~ToAnimation() = default;

QString ToAnimation::ResourcePath(const QString &name)
{
    return QStringLiteral(":/sorvik/animations/") + name;
}

bool ToAnimation::Open(const QString &name)
{
    Stop();
    auto movie = std::make_unique<QMovie>(ResourcePath(name));
    if (!movie->isValid())
        return false;
    // The file's own loop count does not matter: the control repeats until stopped.
    connect(movie.get(), &QMovie::finished, movie.get(), &QMovie::start);
    connect(movie.get(), &QMovie::frameChanged, this, [this] { ++m_framesShown; });
    setMovie(movie.get());
    m_movie = std::move(movie);
    return true;
}

bool ToAnimation::Play()
{
    if (!m_movie)
        return false;
    m_framesShown = 0;
    m_movie->start();
    return m_movie->state() == QMovie::Running;
}

void ToAnimation::Stop()
{
    if (m_movie)
        m_movie->stop();
}

bool ToAnimation::IsPlaying() const
{
    return m_movie && m_movie->state() == QMovie::Running;
}

} // namespace sharedsource
