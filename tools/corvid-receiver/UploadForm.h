#pragma once

#include <cstddef>
#include <cstdio>
#include <map>
#include <string>

class UploadStore;

// One upload form, read part by part as the client sends it: the report (a
// file in the field file_loc) goes straight into an incoming folder of the
// store, the fields domain, regid and access into memory, other fields
// nowhere. Reading stops at the first reason to refuse the form: a wrong
// access code as soon as its field has ended, so a form that sends it before
// the file is refused before the file is read.
class UploadForm
{
public:
    // Longest text field kept; a longer one refuses the form.
    static const std::size_t MaxFieldBytes = 64 * 1024;

    UploadForm(UploadStore &store, std::string accessCode);
    // Removes the incoming folder unless the upload was stored.
    ~UploadForm();
    UploadForm(const UploadForm &) = delete;
    UploadForm &operator=(const UploadForm &) = delete;

    // The form's parts, in order; false stops reading (see refusal()).
    bool beginPart(const std::string &name, const std::string &fileName);
    bool addData(const char *data, std::size_t size);
    // The end of the form (`complete`: it was read to its end); false when it
    // is refused.
    bool finish(bool complete);

    // Writes the fields next to the report and stores both; the upload's
    // number, or 0 (then refusal() says why).
    unsigned store(const std::string &remoteAddress);

    int refusalStatus() const { return m_status; }
    const std::string &refusalText() const { return m_refusal; }

private:
    bool refuse(int status, const std::string &text);
    bool endPart();

    UploadStore &m_store;
    const std::string m_accessCode;
    std::map<std::string, std::string> m_fields; // domain, regid, access: first of each
    std::string m_part;                          // name of the part being read
    std::string *m_textTarget = nullptr;         // where its text goes, if anywhere
    std::string m_incoming;
    std::string m_fileName; // as the client named it, for the fields
    std::string m_storedAs;
    std::FILE *m_file = nullptr;
    unsigned long long m_fileBytes = 0;
    bool m_haveFile = false;
    bool m_stored = false;
    int m_status = 0;
    std::string m_refusal;
};
