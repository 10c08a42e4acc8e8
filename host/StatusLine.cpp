#include "StatusLine.h"
#include "MsgManData.h"

namespace Port {
namespace {

struct State
{
    StatusLine::Display display;
    QString lastText;
};

State &state()
{
    static State s;
    return s;
}

} // namespace

StatusLine::Display StatusLine::setDisplay(Display display)
{
    Display previous = std::move(state().display);
    state().display = std::move(display);
    return previous;
}

void StatusLine::show(const QString &text)
{
    state().lastText = text;
    if (state().display)
        state().display(text);
    else
        Port_MsgManData::debugStub("Status: %s\n", qUtf8Printable(text));
}

QString StatusLine::lastText()
{
    return state().lastText;
}

} // namespace Port
