// Any bytes stand in the store where a value is: what the key answers agrees with the file, and what it answered can be
// stored again. The same bytes are also the file that names the user's folders.
#include "platform/Shell.h"
#include <tessel/base/OVExcept.h>
#include <tessel/registry/WinRegistry.h>

#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <optional>
#include <string>

namespace {

using Key = tessel::AutoDeletor<tessel::IWinRegistryKey, tessel::ReleaseDeletor>;

void Require(bool holds) {
    if (!holds) std::abort();
}

// A store of this process's own, and the files in it that the input becomes.
struct Store {
    Store() {
        std::string name = std::filesystem::temp_directory_path() / "tessel-fuzz-XXXXXX";
        Require(mkdtemp(name.data()) != nullptr);
        folder = name;
        setenv("TESSEL_REGISTRY", name.c_str(), 1);
        setenv("XDG_CONFIG_HOME", name.c_str(), 1);
        Require(tessel::GetCurrentUserRegistryKey(0)->CreateSubKey("Key", key.Out()) == kNoErr);
        for (const auto& file : std::filesystem::recursive_directory_iterator(folder))
            if (file.path().filename() == "Key") value = file.path() / "=Value";
        Require(!value.empty());
    }
    ~Store() { std::filesystem::remove_all(folder); }

    std::filesystem::path folder, value;
    Key key;
};

void Write(const std::filesystem::path& path, const uint8_t* data, size_t size) {
    std::ofstream file(path, std::ios::binary | std::ios::trunc);
    file.write(reinterpret_cast<const char*>(data), static_cast<std::streamsize>(size));
    Require(file.good());
}

struct Value {
    uint32 type;
    std::string data;
};

std::optional<Value> Read(tessel::IWinRegistryKey& key) {
    try {
        uint32 type = 0, size = 0;
        const void* const data = key.QueryValue("Value", &type, &size);
        Require(data != nullptr);
        return Value{type, std::string(static_cast<const char*>(data), size)};
    } catch (const tessel::OVExcept& e) {
        Require(e.Code() == kRegistryErr);
        return std::nullopt;
    }
}

void ReadText(tessel::IWinRegistryKey& key, const Value& value) {
    const bool isText = value.type == kRegistryTypeString || value.type == kRegistryTypeExpandString;
    try {
        const CStr text = key.GetStringValue("Value");
        Require(isText && text);
        if (value.type == kRegistryTypeString) Require(std::strlen(text) <= value.data.size());
    } catch (const tessel::OVExcept& e) {
        Require(e.Code() == kRegistryErr || e.Code() == (isText ? kGenericErr : kRegistryTypeErr));
    }
}

void CheckValue(Store& store, const std::string& file) {
    const std::optional<Value> value = Read(*store.key);
    if (!value) return;
    Require(file == "REG " + file.substr(4, file.find('\n') - 4) + "\n" + value->data);
    Require(std::strtoul(file.c_str() + 4, nullptr, 10) == value->type);
    ReadText(*store.key, *value);
    Require(store.key->SetValue("Value", value->type, value->data.data(), static_cast<uint32>(value->data.size())) ==
            kNoErr);
    const std::optional<Value> again = Read(*store.key);
    Require(again && again->type == value->type && again->data == value->data);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    static Store store;
    Write(store.value, data, size);
    CheckValue(store, std::string(reinterpret_cast<const char*>(data), size));
    Write(store.folder / "user-dirs.dirs", data, size);
    std::string folder;
    if (tessel::platform::ShellFolderName(tessel::platform::ShellFolder::kDesktop, false, folder))
        Require(!folder.empty());
    return 0;
}
