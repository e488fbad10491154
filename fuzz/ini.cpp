// Any bytes are a preference file: it is held, found, changed and written as the model says, and what was written and
// read twice is written again as it is.
#include "IniModel.h"
#include "config/IniDocument.h"

#include <cstdint>
#include <cstdlib>
#include <string>
#include <vector>

namespace {

using tessel::IniDocument;
using tessel::test::IniModel;

void Require(bool holds) {
    if (!holds) std::abort();
}

struct Gathered final : IniDocument::Output {
    bool Write(const char* data, std::size_t size) override {
        bytes.append(data, size);
        return true;
    }
    std::string bytes;
};

std::string Written(const IniDocument& document) {
    Gathered output;
    Require(document.Write(output));
    return output.bytes;
}

bool Read(IniDocument& document, const std::string& bytes) {
    tessel::IniTexts texts;
    char* const text = texts.Allocate(bytes.size() + 1);
    bytes.copy(text, bytes.size());
    text[bytes.size()] = 0;
    return document.Read(std::move(texts), {text, bytes.size()}) == kNoErr;
}

void Compare(const IniDocument& document, const IniModel& model) {
    Require(Written(document) == model.Write());
    for (const IniModel::Section& section : model.sections) {
        for (const IniModel::Key& key : section.keys) {
            const std::string_view* const value = document.Find(section.name, key.name);
            Require(value && *value == key.value);
        }
    }
}

// The bytes say what is changed as well.
void Change(IniDocument& document, IniModel& model, const std::string& bytes) {
    const std::size_t third = bytes.size() / 3;
    const std::string section = bytes.substr(0, third), key = bytes.substr(third, third),
                      value = bytes.substr(2 * third);
    const bool named = !IniModel::Trim(section).empty() && !IniModel::Trim(key).empty();
    Require((document.Set(section, key, value) == kNoErr) == named);
    if (named) model.Set(section, key, value);
    Compare(document, model);
    if (model.sections.empty() || model.sections.back().keys.empty()) return;
    const std::string lastSection = model.sections.back().name, lastKey = model.sections.back().keys.front().name;
    bool removed = false;
    Require(document.Remove(lastSection, lastKey, removed) == kNoErr && removed);
    model.Remove(lastSection, lastKey);
    Compare(document, model);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    const std::string bytes(reinterpret_cast<const char*>(data), size);
    IniDocument document;
    IniModel model;
    const bool read = model.Read(bytes);
    Require(Read(document, bytes) == read);
    if (!read) return 0;
    Compare(document, model);
    Change(document, model, bytes);
    // Texts that were set can hold what ends a line: the first reading shows what they are in a file. From then on each
    // one only takes off a mark behind a mark, or a number that a continued name has behind another.
    std::string written = Written(document);
    for (int reading = 1; Read(document, written); ++reading) {
        Require(model.Read(written));
        Compare(document, model);
        const std::string again = Written(document);
        if (again == written) break;
        Require(reading == 1 || again.size() < written.size());
        written = again;
    }
    return 0;
}
