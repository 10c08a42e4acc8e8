#pragma once

#include <QObject>

#include <functional>
#include <memory>

class CrvC_ReportBuilder;

// Runs the slow half of a report build, CrvC_ReportBuilder::write(), on a
// thread of its own, so that the host's GUI thread stays free while the
// design tools' files are read. The builder must have been prepared on the
// GUI thread (CrvC_ReportBuilder::prepare); nothing else may touch it until
// finished() has arrived.
//
// Deleting this object (or abandon()) while the build runs lets the build
// end on its own: its page's own copy is then removed, so that nothing of it
// can be sent, while the project folder's page is written as usual. Every
// build thread is waited for when the library is unloaded or the process
// ends (waitForAll), so none runs on in code that has gone.
class CrvC_BackgroundBuild : public QObject
{
    Q_OBJECT
public:
    CrvC_BackgroundBuild(std::shared_ptr<CrvC_ReportBuilder> builder, QObject *parent = nullptr);
    ~CrvC_BackgroundBuild() override;

    // True once finished() has been emitted.
    bool isFinished() const { return m_finished; }
    // Lets the build go on without this object: true when it was still
    // running (it removes its own copy when it ends), false when it had
    // ended and the builder is the caller's again. No finished() follows.
    bool abandon();

    // Waits for every build thread started so far.
    static void waitForAll();
    // Runs on the build thread before the build, for tests that hold a build
    // there; unset in the product.
    static void setStartHook(std::function<void()> hook);

Q_SIGNALS:
    // On this object's thread, once the page is written (or failed to be).
    void finished();

private:
    struct Shared;
    std::shared_ptr<Shared> m_shared;
    bool m_finished = false;
    bool m_abandoned = false;
};
