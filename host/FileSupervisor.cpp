#include "FileSupervisor.h"

#include <algorithm>

namespace GuiI {

const Port::XUID &IFileEditorManager::iid()
{
    static const Port::XUID id(0x8AD145AC, 0xEC4FD8EA, 0xBE837BD8, 0xBED09583);
    return id;
}

const Port::XUID &IOpenContext::iid()
{
    static const Port::XUID id("{FC1DAF1A-F9F6-4b06-9795-E73615CD96E2}");
    return id;
}

const Port::XUID &IDesignNameProvider::iid()
{
    static const Port::XUID id("{02C092B4-7972-4bbe-8340-B370F411CC8F}");
    return id;
}

} // namespace GuiI

namespace Gui {
namespace Clip {

const Port::XUID &FileSupervisor::fileEditorCategory()
{
    static const Port::XUID id(0x1770D02C, 0x5E4B279D, 0xCFC132A5, 0x6C06B944);
    return id;
}

FileSupervisor *FileSupervisor::getInstance()
{
    static FileSupervisor instance;
    return &instance;
}

void FileSupervisor::registerEditor(const Port::XUID &category, GuiI::IFileEditorManager *editor)
{
    if (!editor)
        return;
    const auto entry = std::make_pair(category, editor);
    if (std::find(m_editors.begin(), m_editors.end(), entry) == m_editors.end())
        m_editors.push_back(entry);
}

bool FileSupervisor::unregisterEditor(GuiI::IFileEditorManager *editor)
{
    const auto before = m_editors.size();
    m_editors.erase(std::remove_if(m_editors.begin(), m_editors.end(),
                                   [editor](const auto &e) { return e.second == editor; }),
                    m_editors.end());
    return m_editors.size() != before;
}

std::vector<GuiI::IFileEditorManager *> FileSupervisor::editors(const Port::XUID &category) const
{
    std::vector<GuiI::IFileEditorManager *> result;
    for (const auto &e : m_editors) {
        if (e.first == category)
            result.push_back(e.second);
    }
    return result;
}

GuiI::IFileEditorManager *FileSupervisor::findEditor(const Port::StringBase &fileName) const
{
    GuiI::IFileEditorManager *best = nullptr;
    int bestScore = 0;
    for (GuiI::IFileEditorManager *editor : editors(fileEditorCategory())) {
        const int score = editor->getFileSuitability(fileName);
        if (score > bestScore) {
            best = editor;
            bestScore = score;
        }
    }
    return best;
}

} // namespace Clip
} // namespace Gui
