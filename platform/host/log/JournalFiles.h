#pragma once

#include <filesystem>
#include <string>
#include <vector>

#include "platform/posix/Descriptor.h"

/// The files that make up a journal, found as journalctl finds them: those whose names end in
/// .journal or .journal~, in a folder and in the folders below it whose name is a machine ID: 32
/// hexadecimal digits, with dashes or without. Folders of journal namespaces are not among them. Of
/// this machine's journal, /var/log/journal has only the folder of its own ID.
///
/// `journal` is the path of a folder or of one journal file; empty stands for this machine's
/// journal.
namespace host {

/// A file of a journal, open for reading. It stays what it is when the journal is rotated.
struct JournalFile {
  std::filesystem::path path;
  posix::Descriptor descriptor;
};

/// Opens the files of a journal, all as of one moment: none is missed, or opened twice, because
/// the journal is rotated meanwhile. Raises the process's soft limit of open descriptors to the
/// hard one, as journalctl does. Throws `std::runtime_error`, whose text says what is wrong and
/// what can be done, when there is no file, or one that cannot be opened: the others would be taken
/// for the whole journal.
std::vector<JournalFile> openJournalFiles(const std::string& journal);

/// Whether the file at `path`, or one that would be made there, is or would be in a folder of the
/// journal, or is one of its files by another name. True when that cannot be found out.
bool isOfJournal(const std::string& journal, const std::string& path);

}  // namespace host
