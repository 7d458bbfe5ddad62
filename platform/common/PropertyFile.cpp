#include "PropertyFile.h"

#include "PropertyContent.h"
#include "WholeFile.h"

#include <utility>

namespace TK {

PropertyFile::PropertyFile() : content_(std::make_unique<PropertyContent>()) {}

PropertyFile::PropertyFile(std::string path) : path_(std::move(path)) {
    content_ = std::make_unique<PropertyContent>(WholeFile::read(path_));
}

PropertyFile::~PropertyFile() = default;

std::wstring PropertyFile::getEntry(const std::wstring& key) {
    return content_->value(key);
}

void PropertyFile::setEntry(const std::wstring& key, const std::wstring& value) {
    content_->set(key, std::wstring_view(value).substr(0, value.find(L'\0')));
}

void PropertyFile::load() {
    if (!path_.empty()) {
        content_ = std::make_unique<PropertyContent>(WholeFile::read(path_));
    }
}

void PropertyFile::save() {
    if (!path_.empty()) {
        WholeFile::replace(path_, content_->bytes());
    }
}

const std::vector<PropertyFile::DamagedLine>& PropertyFile::damagedLines() const {
    return content_->damaged();
}

} // namespace TK
