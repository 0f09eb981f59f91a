#pragma once

#include <map>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include "MarletFoundation/Platform/Data.h"
#include "MarletFoundation/Platform/ExistingItem.h"
#include "MarletFoundation/Platform/URL.h"

namespace MarletFoundation {

class FileNode;

/// A node of a directory tree, in memory or read from disk as it is looked at. Copies share the node.
///
/// A tree from disk is lazy: a child asked for by name is opened by name, beneath its parent's descriptor, a
/// whole directory is listed only when `fileWrappers` is asked for, and a file's bytes are read (never
/// mapped) at first look. What was looked at once stays. Below the root no symbolic link is followed; links,
/// pipes, sockets and devices are neither directory nor regular file, and nothing blocks on them. What can't
/// be read shows as absent, a file of more than 1 GiB as without contents. One thread at a time may use a
/// tree.
class MARLET_EXPORT FileWrapper {
 public:
  using Children = std::map<std::string, FileWrapper, std::less<>>;

  /// Opens the file or directory at `url`; only this root may be a symbolic link. Its preferred file name is
  /// the URL's last path component. Throws an `ErrorObject` of the POSIX domain when it can't be opened.
  explicit FileWrapper(const URL& url);
  /// What lies at `url`, for a tree that refers to it: it shows what lay there when it was made, and each write takes
  /// what lies there by then, with the children that were put into it or removed since. Where that can't be read it
  /// shows as absent, and a write of it fails.
  static FileWrapper reference(const URL& url);
  static FileWrapper regularFile(Data contents);
  static FileWrapper directory(Children children = {});

  bool isDirectory() const;
  bool isRegularFile() const;
  /// The bytes of a regular file; nothing for any other node, or if they can't be read.
  std::optional<Data> regularFileContents() const;

  /// Whether this is a directory whose children can be asked for.
  bool hasChildren() const;
  /// The child of that name, or nothing; looks at no other child. Any name may be asked for: one that no file
  /// can have finds nothing.
  std::optional<FileWrapper> child(std::string_view name) const;
  /// All children by name; nothing for a node that isn't a directory or can't be listed.
  std::optional<Children> fileWrappers() const;
  /// Throws an `ErrorObject` of the POSIX domain when what lies at a path below this directory can't be read, and so
  /// shows as absent or without contents. For those who act on absence.
  void requireReadable(std::string_view path) const;

  std::optional<std::string> preferredFilename() const;
  void setPreferredFilename(std::string name);

  /// Adds a child under its preferred file name, replacing one of that name. Adding to a node that is not a
  /// directory, or a child without a preferred file name, is a fatal error.
  void addFileWrapper(FileWrapper child);
  void removeFileWrapper(std::string_view name);

  /// Whether something else has taken the place that this wrapper was opened at, or it was removed. The tree
  /// goes on showing the old item, but for what had not been looked at when that went away, which shows as
  /// absent. False for a node in memory.
  bool wasReplaced() const;
  /// Whether all that was looked at, here and below, is still as it was found: then what was read is one state of
  /// the document. A reader asks at its end, and opens again where it isn't. What couldn't be read counts as found so.
  bool isUnchanged() const;

  /// Writes the tree to `url`, all of it or nothing: it is built in a sibling of `url`, flushed, and takes
  /// the place of what was there, or of what a symbolic link there points to. Unchanged files are shared with
  /// the directory that is replaced and need not be readable; modes, extended attributes and symbolic links of a
  /// tree from disk stay, and what is new takes the mode and attributes of what it replaces. A wrapper that was
  /// opened at `url` goes on in what was written.
  ///
  /// Nothing is lost to another writer, in this process or another. A tree from disk is written only while that is as
  /// it was found, at any depth: what was looked at, put in or removed must not have changed (ESTALE), nor have been
  /// unreadable where something else is put there (the error that was met). What nobody looked at goes along as it
  /// is. The directory that is replaced must not change while the tree is written (ESTALE). After a failure everything
  /// is as it was: read again, change again, write again. Of two writers the second waits for the first's last step, up
  /// to ten seconds (EBUSY).
  ///
  /// Throws an `ErrorObject` of the POSIX domain, also for a child whose name is empty, ".", ".." or holds a slash
  /// or NUL (EINVAL), for a directory within itself (ELOOP, EINVAL), for a node that couldn't be read or is of no
  /// writable kind (EINVAL), for mount points, here or below (EBUSY), for a path whose links change while it is written
  /// (ESTALE), for one that something lies at which is to be kept (EEXIST), and after `cancelWrites` (ECANCELED).
  /// A directory that is replaced is another one afterwards: watch its parent for changes. What of the old one
  /// can't be removed is told to `HostEnvironment::leftBehind`.
  void write(const URL& url, ExistingItem existing = ExistingItem::Replaced) const;

 private:
  explicit FileWrapper(std::shared_ptr<FileNode> node) : node_(std::move(node)) {}
  std::shared_ptr<FileNode> node_;
};

}  // namespace MarletFoundation
