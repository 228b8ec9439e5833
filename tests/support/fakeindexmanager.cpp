#include "support/fakeindexmanager.h"

namespace testsupport {

void FakeIndexManager::Script(std::vector<Answer> answers)
{
    const std::lock_guard<std::mutex> guard(m_lock);
    m_answers.assign(answers.begin(), answers.end());
}

void FakeIndexManager::Release1()
{
    {
        const std::lock_guard<std::mutex> guard(m_lock);
        ++m_released;
    }
    m_changed.notify_all();
}

bool FakeIndexManager::WaitForCalls(int n, std::chrono::milliseconds within)
{
    std::unique_lock<std::mutex> lock(m_lock);
    return m_changed.wait_for(lock, within, [&] { return int(m_starts.size()) >= n; });
}

int FakeIndexManager::Calls() const
{
    const std::lock_guard<std::mutex> guard(m_lock);
    return int(m_starts.size());
}

std::vector<FakeIndexManager::Clock::time_point> FakeIndexManager::CallStarts() const
{
    const std::lock_guard<std::mutex> guard(m_lock);
    return m_starts;
}

std::vector<FakeIndexManager::Clock::time_point> FakeIndexManager::CallEnds() const
{
    const std::lock_guard<std::mutex> guard(m_lock);
    return m_ends;
}

void FakeIndexManager::WaitForUpdate(std::int32_t *status)
{
    std::unique_lock<std::mutex> lock(m_lock);
    m_starts.push_back(Clock::now());
    m_changed.notify_all();
    Answer answer;
    if (!m_answers.empty()) {
        answer = m_answers.front();
        m_answers.pop_front();
    }
    if (answer.held) {
        m_changed.wait(lock, [this] { return m_released > 0; });
        --m_released;
    }
    m_ends.push_back(Clock::now());
    if (answer.status != 0)
        *status = answer.status;
}

} // namespace testsupport
