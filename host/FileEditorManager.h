#pragma once

#include "Interface.h"
#include "StringBase.h"

namespace GuiI {

// A file editor: something that can open files of some kind in the host.
// Editors register with Gui::Clip::FileSupervisor under the file-editor
// category; when the host opens a file it asks every editor for its
// suitability and hands the file to the one that answers highest.
class ORBHOST_EXPORT IFileEditorManager : public CitI::IInterface
{
public:
    // Suitability answers of getFileSuitability.
    enum Suitability { NotSuitable = 0, CanOpen = 1, PreferredEditor = 2 };

    static const Port::XUID &iid();

    // slot 2: the editor's display name.
    virtual Port::StringBase getDisplayName() = 0;
    // slot 3: number of documents the editor has open.
    virtual int getOpenDocumentCount() = 0;
    // slot 4: file dialog filter of the files the editor creates ("" when none).
    virtual Port::StringBase getNewFileFilter() = 0;
    // slot 5: opens `fileName`; `options` is reserved (0); `context` describes
    // where the open request comes from and may be null. Returns 0 when the
    // request was taken; editors that work asynchronously return 0 as well.
    virtual int openFile(const Port::StringBase &fileName, int options, CitI::IInterface *context) = 0;
    // slot 6: version of this interface the editor implements (1).
    virtual int getInterfaceVersion() = 0;
    // slot 7: true when the editor can create new files.
    virtual bool canCreateFiles() = 0;
    // slot 8: how many files one open request may name (1).
    virtual int getMaxFilesPerOpen() = 0;
    // slot 9: creates a new file; 0 when not supported.
    virtual int createFile(const Port::StringBase &fileName) = 0;
    // slot 10: saves the open documents; 0 when there is nothing to save.
    virtual int saveAll() = 0;
    // slot 11: closes the open documents; 0 when there is nothing to close.
    virtual int closeAll() = 0;
    // slot 12: number of modified documents.
    virtual int getModifiedDocumentCount() = 0;
    // slot 13: help topic of the editor ("" when none).
    virtual Port::StringBase getHelpTopic() = 0;
    // slot 14: how well the editor suits `fileName` (Suitability).
    virtual int getFileSuitability(const Port::StringBase &fileName) = 0;
};

// The context of an open request: answers IDesignNameProvider when the host
// knows which design the file belongs to.
class ORBHOST_EXPORT IOpenContext : public CitI::IInterface
{
public:
    static const Port::XUID &iid(); // {FC1DAF1A-F9F6-4b06-9795-E73615CD96E2}
};

class ORBHOST_EXPORT IDesignNameProvider : public CitI::IInterface
{
public:
    static const Port::XUID &iid(); // {02C092B4-7972-4bbe-8340-B370F411CC8F}

    // slot 2: the project name.
    virtual Port::StringBase getProjectName() = 0;
    // slot 3: "<project name>|<design name>".
    virtual Port::StringBase getDesignText() = 0;
};

} // namespace GuiI

#include <QtPlugin>
Q_DECLARE_INTERFACE(GuiI::IFileEditorManager, "GuiI::IFileEditorManager")
