#pragma once

#include <filesystem>
#include <string>
#include <vector>

/// A large book on disk for the figures of opening: pages in chapters of a hundred, each with a manifest of
/// about 600 bytes, a result record, and a source and a resource of `bulk` bytes (holes, so that they cost no
/// disk).
void generateBook(const std::filesystem::path& book, int pages, std::uintmax_t bulk,
                  std::string_view contentVersion = "1.0");

/// The paths of the files that opening has to read: each page's manifest and result record.
std::vector<std::string> pageFiles(const std::filesystem::path& book);
