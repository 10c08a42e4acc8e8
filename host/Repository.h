#pragma once

#include "Interface.h"
#include "StringBase.h"

// The project repository: a hierarchical key/value store that belongs to one
// project file. Its levels are project file -> section -> sub-section -> key;
// every value is text (UTF-8).
//
// The store is provided by the component library "libPrjrep_Repository"
// (CitP::Factory::LoadLibraryFactory). Its repository object,
// Prjrep::IRepository::objectId(), is made with CitP::Factory::CreateInstance
// and answers Prjrep::IRepository. The values live in an SQLite file beside
// the project file: "<dir>/<name>.orbrepo" for "<dir>/<name>.orb" (a project
// file without the ".orb" suffix gets ".orbrepo" appended to its whole name).
// Every write is one transaction of its own, so several processes may write
// the same repository at once. An operation that finds the file locked by
// another process waits for it up to two seconds, then fails (StatusFailed):
// a failure to read is never an absent value (StatusNotFound).
//
// Status: every operation answers StatusOk (1) on success. Success of an
// open means status 1 together with a non-null object; anything else is a
// failure and leaves the out-parameter null.
//
// Ownership: sections are owned by the repository object that opened them
// and sub-sections by their section. None of them is reference counted for
// the caller. Give a sub-section back with IRegSection::releaseSubSection;
// IRepository::close ends every section and sub-section opened through the
// object (so does its destruction). Pointers to them are invalid afterwards.

namespace Prjrep {

// Open modes: bit flags.
enum OpenMode {
    ModeRead = 0x01,   // values can be read
    ModeWrite = 0x02,  // values can be written
    ModeCreate = 0x08, // a missing repository file, section or sub-section is created
    ModeShared = 0x20, // other processes may open the repository at the same time (always so)

    // 43 (0x2B): read/write; the repository file, section and sub-section are
    // created when missing.
    ModeReadWriteCreate = ModeRead | ModeWrite | ModeCreate | ModeShared,
    // 1: read-only; the repository file, section and sub-section must exist.
    ModeReadOnly = ModeRead
};

enum Status {
    StatusFailed = 0, // the store could not be read or written
    StatusOk = 1,
    StatusNotFound = 2, // no such project file, repository, section, sub-section or key
    StatusDenied = 3,   // the mode does not allow the operation
    StatusConflict = 4  // the stored value is not the one expected (replaceValue)
};

// A section or sub-section of a project repository.
class IRegSection : public CitI::IInterface
{
public:
    static const Port::XUID &iid()
    {
        static const Port::XUID id("{4026998c-1eee-4db3-bc9f-615ec0ffd949}");
        return id;
    }

    virtual Port::StringBase getName() = 0;

    // Opens the sub-section `name` of this section. With a mode that writes,
    // this section must have been opened with one that writes as well.
    virtual int openSubSection(const Port::StringBase &name, int mode, IRegSection **subSection) = 0;
    // Gives back a sub-section opened through this section.
    virtual void releaseSubSection(IRegSection *subSection) = 0;

    // The value of `key`; StatusNotFound (and empty text) when it has none.
    virtual int getValue(const Port::StringBase &key, Port::StringBase &value) = 0;
    // Stores `value` under `key`, replacing what was there.
    virtual int setValue(const Port::StringBase &key, const Port::StringBase &value) = 0;
    // Stores `value` under `key` only if the key holds `expected` (with a
    // null `expected`: only if the key has no value), in one transaction, so
    // that what another process stored in between is never overwritten
    // unseen. StatusConflict, with nothing stored, when the key held
    // something else.
    virtual int replaceValue(const Port::StringBase &key, const Port::StringBase *expected,
                             const Port::StringBase &value) = 0;
};

// The repository object.
class IRepository : public CitI::IInterface
{
public:
    // The interface.
    static const Port::XUID &iid()
    {
        static const Port::XUID id("{4acc753f-32b2-4730-96e6-8cf7f75dde8b}");
        return id;
    }
    // The object that CitP::Factory::CreateInstance makes.
    static const Port::XUID &objectId()
    {
        static const Port::XUID id("{cd48a8b1-2990-4881-8664-52802c04fdff}");
        return id;
    }

    // Opens `section` of the repository of `projectFile` (which must exist).
    // On success *section answers IRegSection.
    virtual int openSection(const Port::StringBase &projectFile, const Port::StringBase &name, int mode,
                            CitI::IInterface **section) = 0;
    // Ends every section opened through this object and closes the store.
    virtual void close() = 0;
};

} // namespace Prjrep
