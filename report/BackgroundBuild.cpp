#include "BackgroundBuild.h"

#include "ReportBuilder.h"

#include <QList>
#include <QThread>

#include <mutex>

struct CrvC_BackgroundBuild::Shared
{
    std::mutex mutex;
    CrvC_BackgroundBuild *owner = nullptr; // null once abandoned
    bool done = false;
    std::shared_ptr<CrvC_ReportBuilder> builder;
};

namespace {

std::function<void()> startHook;

// The build threads, created and reaped on the GUI thread. Ended threads are
// deleted when the next build starts; the rest are waited for before the
// code they run goes away.
struct BuildThreads
{
    QList<QThread *> threads;
    ~BuildThreads() { CrvC_BackgroundBuild::waitForAll(); }

    void reap()
    {
        for (auto it = threads.begin(); it != threads.end();) {
            if ((*it)->isFinished()) {
                (*it)->wait();
                delete *it;
                it = threads.erase(it);
            } else {
                ++it;
            }
        }
    }
};
BuildThreads buildThreads;

} // namespace

CrvC_BackgroundBuild::CrvC_BackgroundBuild(std::shared_ptr<CrvC_ReportBuilder> builder, QObject *parent)
    : QObject(parent), m_shared(std::make_shared<Shared>())
{
    m_shared->owner = this;
    m_shared->builder = std::move(builder);
    buildThreads.reap();
    const std::function<void()> hook = startHook;
    QThread *thread = QThread::create([shared = m_shared, hook] {
        if (hook)
            hook();
        shared->builder->write();
        std::lock_guard<std::mutex> lock(shared->mutex);
        shared->done = true;
        if (CrvC_BackgroundBuild *owner = shared->owner) {
            // Posted while the owner cannot go (it takes the lock first); an
            // owner deleted before the call runs drops it with its events.
            QMetaObject::invokeMethod(
                owner,
                [owner] {
                    if (owner->m_abandoned)
                        return;
                    owner->m_finished = true;
                    emit owner->finished();
                },
                Qt::QueuedConnection);
        } else {
            shared->builder->discardOwnCopy();
        }
    });
    thread->setObjectName(QStringLiteral("Corvid report build"));
    buildThreads.threads << thread;
    thread->start();
}

CrvC_BackgroundBuild::~CrvC_BackgroundBuild()
{
    abandon();
}

bool CrvC_BackgroundBuild::abandon()
{
    m_abandoned = true;
    std::lock_guard<std::mutex> lock(m_shared->mutex);
    const bool running = !m_shared->done && m_shared->owner;
    m_shared->owner = nullptr;
    return running;
}

void CrvC_BackgroundBuild::waitForAll()
{
    for (QThread *thread : std::as_const(buildThreads.threads)) {
        thread->wait();
        delete thread;
    }
    buildThreads.threads.clear();
}

void CrvC_BackgroundBuild::setStartHook(std::function<void()> hook)
{
    startHook = std::move(hook);
}
