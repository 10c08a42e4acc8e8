#pragma once

#include <mutex>
#include <string>

// The receiver's data folder. An upload is written into a private folder of
// its own inside it (".incoming-XXXXXX", never numbered), then renamed in one
// step to the next free number ("000001", "000002", ...), so that a numbered
// folder always holds a whole upload, also after the receiver was killed.
// An existing folder is never replaced, also not one of another receiver on
// the same folder.
class UploadStore
{
public:
    // The file in each upload's folder that holds its fields. No upload can
    // take this name: uploaded files are named by safeFileName().
    static const char MetadataName[];

    explicit UploadStore(std::string dir);

    // A new private folder for an upload being received; empty on failure.
    std::string createIncoming();
    // Moves a complete incoming folder into place under the next free number.
    // The upload is stored once this returns its number; 0 when it could not
    // be stored (the incoming folder is then left to the caller).
    unsigned commit(const std::string &incoming);
    // Removes an incoming folder and the files in it.
    static void discard(const std::string &incoming);

    std::string folderOf(unsigned number) const;

    // The sender's file name reduced to a harmless base name: letters,
    // digits, ".", "_" and "-", no leading dot; "report" when nothing is left.
    static std::string safeFileName(const std::string &name);

private:
    unsigned highestNumber() const;

    const std::string m_dir;
    std::mutex m_mutex;
    unsigned m_last = 0;
};
