#pragma once

#include <QString>

#include <cstddef>
#include <cstdint>

// Shared by the fuzz harnesses: each input goes to a file in a private
// temporary directory (removed at exit), because every reader under test
// takes a path, not a buffer.
namespace CorvidFuzz {

// The private directory, created on first use (with a QCoreApplication, so
// readers see the same Qt set-up as in the host).
QString workDir();

// Writes `size` bytes to workDir()/<relativePath> (folders created) and
// answers its full path. Aborts when the file cannot be written: a harness
// that silently tests nothing would hide every fault.
QString writeInput(const QString &relativePath, const uint8_t *data, size_t size);

} // namespace CorvidFuzz
