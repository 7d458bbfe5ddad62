// The asset tag that an administrator gives this machine, and the file that keeps it.
#pragma once

#include <DateTime.h>

#include <string>

struct AssetTag {
    std::string text;         // empty: never set
    TK::DateTime changed;     // the last time that it was set
    unsigned int changes = 0; // how often it was set
};

// Whether a text may be an asset tag: one to 64 characters, none of them a control character, no blank at an
// end, nothing that the library's screen for users' texts refuses. A tag with blanks at its ends would read
// back without them from the file. The text is in the encoding of LC_CTYPE.
bool isAcceptableAssetTag(const std::string& text);

// A property file. The objects of all threads take turns by TK::_fileMutex.
class AssetTagFile {
public:
    explicit AssetTagFile(std::string path) : path_(std::move(path)) {}

    // Throws std::system_error when the file is there but cannot be read.
    AssetTag read() const;
    // Stores the tag with this moment as its date. Makes the file, and its folder. Throws std::system_error
    // when that fails or the path is empty; the file then holds what it held before.
    void write(const std::string& text) const;

private:
    std::string path_;
};
