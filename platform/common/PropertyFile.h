/**
 * @file
 * TK::PropertyFile, values under keys in a text file that people edit too.
 *
 * @code
 * TK::PropertyFile file("/etc/agent/asset.properties");
 * file.setEntry(L"asset.tag", L"R 12 = lab");
 * file.save();
 * @endcode
 *
 * **The file.** UTF-8, one entry a line: `key=value`. Blanks (spaces and tabs) at both ends of the key and of
 * the value do not count; a value may hold equals signs. A line whose first character that is no blank is `#`
 * is a comment. Of two lines with one key, the later counts. Escapes in keys and values:
 *
 * | Escape | Stands for |
 * |---|---|
 * | `\n`, `\r`, `\t`, `\s` | line feed, carriage return, tab, space |
 * | `\\`, `\=`, `\#` | backslash, equals sign, number sign |
 * | `\u{1F600}` | the character with that code in one to eight hexadecimal digits, be it Unicode's or not |
 *
 * What is written is escaped where it has to be, so that every key and every value reads back as it was, and
 * with it what no Unicode text holds: lone surrogates and codes above U+10FFFF.
 *
 * What a change does not touch stays byte for byte: comments, empty lines, order, a byte order mark, line
 * ends (LF or CRLF; new lines get the first line's), a missing end of the last line. So do damaged lines,
 * which hold no entry: see damagedLines().
 *
 * **Threads.** A file object is used by one thread at a time; objects share nothing, but two that stand for
 * one file overwrite each other's changes.
 */
#pragma once

#include "TKExport.h"

#include <cstddef>
#include <memory>
#include <string>
#include <vector>

namespace TK {

class PropertyContent;

/** A property file, or the like in memory. Can be derived from. */
class TK_EXPORT PropertyFile {
public:
    /**
     * Creates an empty one in memory alone: load() and save() do nothing.
     * @throws std::bad_alloc
     */
    PropertyFile();

    /**
     * Reads a file as load() does.
     * @param path the file's path, absolute unless the process stays in its folder.
     * @throws std::system_error when the file exists but cannot be read.
     * @throws std::bad_alloc
     */
    explicit PropertyFile(std::string path);

    PropertyFile(const PropertyFile&) = delete;
    PropertyFile& operator=(const PropertyFile&) = delete;
    virtual ~PropertyFile();

    /**
     * The value stored under a key, or the empty text when there is none.
     * @throws std::bad_alloc
     */
    virtual std::wstring getEntry(const std::wstring& key);

    /**
     * Stores a value under a key, in memory: save() writes it. An entry that exists stays in its line, a new
     * one goes to the end.
     * @param key any text.
     * @param value any text; what follows its first NUL character is dropped.
     * @throws std::bad_alloc, and then nothing has changed.
     */
    virtual void setEntry(const std::wstring& key, const std::wstring& value);

    /**
     * Reads the file anew; changes that were not saved are lost. A file that does not exist is an empty one.
     * @throws std::system_error when the file exists but cannot be read; the entries are then as before.
     * @throws std::bad_alloc likewise.
     */
    void load();

    /**
     * Writes the file, all or nothing: a reader, and whatever fails, sees the earlier content or the new one
     * whole. The file keeps its permission bits, its access control list and its other extended attributes,
     * and its owner and group where the process may set them; where it may not set the group, the group loses
     * its permissions. A new file can be read by its owner alone. A symbolic link stays, and the file that it
     * names is written. Temporary files of earlier saves whose process was killed are removed.
     *
     * @throws std::system_error when it cannot be written or keep an attribute; the earlier file is then
     * untouched, unless its folder alone could not be synchronised: then the new content is in place but may
     * not outlive a power failure.
     * @throws std::bad_alloc
     */
    void save();

    /** A line that is neither entry nor comment nor empty. */
    struct DamagedLine {
        std::size_t number; ///< the line's number, from 1
        const char* reason; ///< what is wrong, in English; lives for ever
    };

    /**
     * The lines that could not be read when the file was loaded: without equals sign, with an unknown escape,
     * not UTF-8, or with a NUL. They are written back as they are.
     * @return the lines by rising number; belongs to the file object, valid until load().
     */
    const std::vector<DamagedLine>& damagedLines() const;

private:
    std::string path_;
    std::unique_ptr<PropertyContent> content_;
};

} // namespace TK
