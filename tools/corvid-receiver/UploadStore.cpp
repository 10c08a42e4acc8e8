#include "UploadStore.h"

#include <dirent.h>
#include <fcntl.h>
#include <stdio.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cctype>
#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <vector>

const char UploadStore::MetadataName[] = "@fields.txt";

namespace {

// The number a folder name stands for: digits only; 0 for any other name.
unsigned numberOf(const char *name)
{
    if (!std::isdigit(static_cast<unsigned char>(name[0])))
        return 0;
    char *end = nullptr;
    errno = 0;
    const unsigned long value = std::strtoul(name, &end, 10);
    return !*end && errno == 0 && value <= 0xffffffffUL ? unsigned(value) : 0;
}

void syncFolder(const std::string &folder)
{
    const int fd = ::open(folder.c_str(), O_RDONLY | O_DIRECTORY);
    if (fd >= 0) {
        ::fsync(fd);
        ::close(fd);
    }
}

// rename() that fails with EEXIST when `to` exists. Without the kernel's
// help (some file systems) the test before the rename leaves a short gap, in
// which only another receiver on the same folder could come first.
bool moveWithoutReplacing(const std::string &from, const std::string &to)
{
    if (::renameat2(AT_FDCWD, from.c_str(), AT_FDCWD, to.c_str(), RENAME_NOREPLACE) == 0)
        return true;
    if (errno != EINVAL && errno != ENOSYS)
        return false;
    if (::access(to.c_str(), F_OK) == 0 || errno != ENOENT) {
        errno = EEXIST;
        return false;
    }
    if (::rename(from.c_str(), to.c_str()) == 0)
        return true;
    if (errno == ENOTEMPTY)
        errno = EEXIST;
    return false;
}

} // namespace

UploadStore::UploadStore(std::string dir) : m_dir(std::move(dir))
{
}

std::string UploadStore::createIncoming()
{
    std::string path = m_dir + "/.incoming-XXXXXX";
    std::vector<char> name(path.begin(), path.end());
    name.push_back('\0');
    // mkdtemp makes the folder for its owner only; stored folders are as
    // readable as the data folder.
    if (!::mkdtemp(name.data()) || ::chmod(name.data(), 0755) != 0)
        return std::string();
    return name.data();
}

unsigned UploadStore::commit(const std::string &incoming)
{
    std::lock_guard<std::mutex> lock(m_mutex);
    // The highest number is read once; when another receiver takes a number
    // first, it is read again. RENAME_NOREPLACE fails on any existing
    // folder, even an empty one.
    bool scanned = m_last != 0;
    for (int attempt = 0; attempt < 100; ++attempt) {
        if (!scanned) {
            m_last = highestNumber();
            scanned = true;
        }
        if (m_last == 0xffffffffU)
            return 0;
        const unsigned number = m_last + 1;
        if (moveWithoutReplacing(incoming, folderOf(number))) {
            m_last = number;
            syncFolder(m_dir);
            return number;
        }
        if (errno != EEXIST)
            return 0;
        scanned = false;
        m_last = number;
    }
    return 0;
}

void UploadStore::discard(const std::string &incoming)
{
    if (DIR *dir = ::opendir(incoming.c_str())) {
        while (const dirent *entry = ::readdir(dir)) {
            const std::string name = entry->d_name;
            if (name != "." && name != "..")
                ::unlink((incoming + "/" + name).c_str());
        }
        ::closedir(dir);
    }
    ::rmdir(incoming.c_str());
}

std::string UploadStore::folderOf(unsigned number) const
{
    char name[16];
    std::snprintf(name, sizeof name, "%06u", number);
    return m_dir + "/" + name;
}

std::string UploadStore::safeFileName(const std::string &name)
{
    const size_t slash = name.find_last_of("/\\");
    const std::string base = name.substr(slash == std::string::npos ? 0 : slash + 1);
    std::string out;
    for (char c : base)
        out += (std::isalnum(static_cast<unsigned char>(c)) || c == '.' || c == '_' || c == '-') ? c : '_';
    while (!out.empty() && out[0] == '.')
        out.erase(0, 1);
    if (out.empty() || out.size() > 200)
        out = "report";
    return out;
}

unsigned UploadStore::highestNumber() const
{
    unsigned highest = 0;
    if (DIR *dir = ::opendir(m_dir.c_str())) {
        while (const dirent *entry = ::readdir(dir))
            highest = std::max(highest, numberOf(entry->d_name));
        ::closedir(dir);
    }
    return highest;
}
