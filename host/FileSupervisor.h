#pragma once

#include "FileEditorManager.h"

#include <vector>

namespace Gui {
namespace Clip {

// The host's registry of file editors, by category.
class ORBHOST_EXPORT FileSupervisor
{
public:
    // Category of the editors that open files (the only one the host uses).
    static const Port::XUID &fileEditorCategory();

    static FileSupervisor *getInstance();

    // Registers `editor` in `category`; registering it twice keeps one entry.
    void registerEditor(const Port::XUID &category, GuiI::IFileEditorManager *editor);
    // Removes `editor` from every category; false when it was not registered.
    bool unregisterEditor(GuiI::IFileEditorManager *editor);

    std::vector<GuiI::IFileEditorManager *> editors(const Port::XUID &category) const;

    // The editor of the file-editor category that answers the highest
    // non-zero suitability for `fileName` (the first registered on a tie),
    // or null when none claims it.
    GuiI::IFileEditorManager *findEditor(const Port::StringBase &fileName) const;

private:
    FileSupervisor() = default;
    std::vector<std::pair<Port::XUID, GuiI::IFileEditorManager *>> m_editors;
};

} // namespace Clip
} // namespace Gui
