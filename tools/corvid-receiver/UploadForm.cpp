#include "UploadForm.h"

#include "ReceiverText.h"
#include "UploadStore.h"

#include <unistd.h>

namespace {

const char fileField[] = "file_loc";
const char accessField[] = "access";
const char *const textFields[] = {"domain", "regid", "access"};
const char storeError[] = "error: the report could not be stored\n";

// Flushes and closes `file`, with its data on disk; false when any of it failed.
bool closeSynced(std::FILE *file)
{
    const bool written = std::fflush(file) == 0 && ::fsync(::fileno(file)) == 0;
    return std::fclose(file) == 0 && written;
}

} // namespace

UploadForm::UploadForm(UploadStore &store, std::string accessCode)
    : m_store(store), m_accessCode(std::move(accessCode))
{
}

UploadForm::~UploadForm()
{
    if (m_file)
        std::fclose(m_file);
    if (!m_stored && !m_incoming.empty())
        UploadStore::discard(m_incoming);
}

bool UploadForm::refuse(int status, const std::string &text)
{
    if (!m_status) {
        m_status = status;
        m_refusal = text;
    }
    return false;
}

bool UploadForm::beginPart(const std::string &name, const std::string &fileName)
{
    if (!endPart())
        return false;
    m_part = name;
    if (name == fileField && !fileName.empty()) {
        if (m_haveFile)
            return refuse(400, "refused: more than one file in field file_loc\n");
        m_haveFile = true;
        m_fileName = fileName;
        m_storedAs = UploadStore::safeFileName(fileName);
        m_incoming = m_store.createIncoming();
        if (m_incoming.empty() || !(m_file = std::fopen((m_incoming + "/" + m_storedAs).c_str(), "wbx")))
            return refuse(500, storeError);
        return true;
    }
    for (const char *field : textFields)
        if (name == field && !m_fields.count(name))
            m_textTarget = &m_fields[name];
    return true;
}

bool UploadForm::addData(const char *data, std::size_t size)
{
    if (m_status)
        return false;
    if (m_file) {
        if (std::fwrite(data, 1, size, m_file) != size)
            return refuse(500, storeError);
        m_fileBytes += size;
    } else if (m_textTarget) {
        if (m_textTarget->size() + size > MaxFieldBytes)
            return refuse(400, "refused: field " + m_part + " is longer than " + std::to_string(MaxFieldBytes)
                                   + " bytes\n");
        m_textTarget->append(data, size);
    }
    return true;
}

bool UploadForm::endPart()
{
    if (m_status)
        return false;
    if (m_file) {
        const bool written = closeSynced(m_file);
        m_file = nullptr;
        if (!written)
            return refuse(500, storeError);
    }
    if (m_part == accessField && m_textTarget && *m_textTarget != m_accessCode)
        return refuse(403, "refused: wrong access code\n");
    m_part.clear();
    m_textTarget = nullptr;
    return true;
}

bool UploadForm::finish(bool complete)
{
    if (!endPart())
        return false;
    if (!complete)
        return refuse(400, "refused: the form could not be read\n");
    if (!m_fields.count(accessField))
        return refuse(403, "refused: wrong access code\n");
    if (!m_haveFile)
        return refuse(400, "refused: no file in field file_loc\n");
    return true;
}

unsigned UploadForm::store(const std::string &remoteAddress)
{
    using ReceiverText::escaped;
    const std::string fields =
        "received=" + ReceiverText::utcNow() + "\nremote=" + escaped(remoteAddress)
        + "\nfile_loc=" + escaped(m_fileName) + "\nsize=" + std::to_string(m_fileBytes)
        + "\ndomain=" + escaped(m_fields["domain"]) + "\nregid=" + escaped(m_fields["regid"])
        + "\naccess=" + escaped(m_fields[accessField]) + "\nstored_as=" + m_storedAs + "\n";
    std::FILE *file = std::fopen((m_incoming + "/" + UploadStore::MetadataName).c_str(), "wbx");
    const bool written = file && std::fwrite(fields.data(), 1, fields.size(), file) == fields.size();
    if (!file || !closeSynced(file) || !written) {
        refuse(500, storeError);
        return 0;
    }
    const unsigned number = m_store.commit(m_incoming);
    if (!number) {
        refuse(500, storeError);
        return 0;
    }
    m_stored = true;
    return number;
}
