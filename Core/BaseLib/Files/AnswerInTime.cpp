#include "Core/BaseLib/Files/AnswerInTime.h"

#include <QFileInfo>
#include <QHash>

#include <algorithm>

namespace {

constexpr std::chrono::seconds kPatience(10); ///< a disk that sleeps takes some
constexpr std::chrono::seconds kLessPatience(1);
constexpr std::chrono::seconds kValid(30);

struct Answer {
    bool isThere;
    std::chrono::steady_clock::time_point when;

    bool isValid() const { return std::chrono::steady_clock::now() - when < kValid; }
};

} // namespace

bool answers(const QString &path)
{
    // NOTE: not one for each thread: MinGW frees such memory before what is in it is destroyed.
    static std::mutex mutex;
    static auto &known = *new QHash<QString, Answer>; // for ever: threads may outlive what is static
    std::unique_lock<std::mutex> lock(mutex);
    if (const auto before = known.constFind(path); before != known.constEnd() && before->isValid())
        return before->isThere;
    const bool isSilenceKnown = std::any_of(known.cbegin(), known.cend(), [](const Answer &answer) {
        return !answer.isThere && answer.isValid();
    });
    lock.unlock();
    const bool isThere = answerInTime(isSilenceKnown ? kLessPatience : kPatience, [path] {
                             return QFileInfo::exists(path);
                         }).has_value();
    lock.lock();
    known.insert(path, {isThere, std::chrono::steady_clock::now()});
    return isThere;
}

bool fileAnswers(const QString &path)
{
    const QFileInfo file(path);
    return answers(file.path()) && (!file.isSymLink() || answers(path));
}
