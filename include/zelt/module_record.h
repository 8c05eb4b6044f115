// The registration record: a small text file that says where the module lies and which classes it has, so that a host
// finds it by a class's name. DllRegisterServer writes it, DllUnregisterServer removes it; nothing else touches it.
//
//     [Module]
//     Format=1
//     Name=ZELT
//     Path=/usr/local/lib/libzelt.so.1
//     [Class]
//     ClassID={5A1E0001-0002-4000-8000-00000000C0DE}
//     ProgID=ZELT.Main2.1
//     VersionIndependentProgID=ZELT.Main2
//
// A record lies at zelt/ZELT.module below a data folder: $XDG_DATA_HOME (~/.local/share without it) for a user,
// /usr/local/share for the machine. Readers look at the user's first, then below each folder of $XDG_DATA_DIRS
// (/usr/local/share and /usr/share without it). Programs that run with more rights than their user see no environment,
// so that nobody hands them a module; folders that are not absolute do not count.
#pragma once

#include "zelt/com/types.h"

#include <algorithm>
#include <cstdlib>
#include <string>
#include <string_view>
#include <vector>

namespace zelt {

inline constexpr std::string_view record_name = "zelt/ZELT.module"; ///< below a data folder
inline constexpr std::string_view machine_data = "/usr/local/share";
inline constexpr size_t most_record_bytes = 64 << 10; ///< a longer file is no record

/// The user's data folder; empty when the environment names none.
inline std::string user_data()
{
    const auto absolute = [](const char* name) { return name && *name == '/' ? name : ""; };
    if (const std::string own = absolute(secure_getenv("XDG_DATA_HOME")); !own.empty()) return own;
    const std::string home = absolute(secure_getenv("HOME"));
    return home.empty() ? home : home + "/.local/share";
}

/// All data folders, in the order in which records count.
inline std::vector<std::string> data_folders()
{
    std::vector<std::string> folders{user_data()};
    const char* const named = secure_getenv("XDG_DATA_DIRS");
    std::string_view rest = named && *named ? named : "/usr/local/share:/usr/share";
    while (!rest.empty()) {
        const size_t end = std::min(rest.find(':'), rest.size());
        folders.emplace_back(rest.substr(0, end));
        rest.remove_prefix(std::min(end + 1, rest.size()));
    }
    std::erase_if(folders, [](const std::string& folder) { return folder.empty() || folder[0] != '/'; });
    return folders;
}

/// Reads what guid_to_text writes.
inline bool guid_from_text(std::string_view text, Qor::GUID& id) noexcept
{
    constexpr std::string_view form = "{xxxxxxxx-xxxx-xxxx-xxxx-xxxxxxxxxxxx}";
    if (text.size() != form.size()) return false;
    uint8_t bytes[16] = {};
    int digits = 0;
    for (size_t i = 0; i < form.size(); ++i) {
        const char c = text[i];
        if (form[i] != 'x') {
            if (c != form[i]) return false;
            continue;
        }
        const int value = c >= '0' && c <= '9'   ? c - '0'
                          : c >= 'A' && c <= 'F' ? c - 'A' + 10
                          : c >= 'a' && c <= 'f' ? c - 'a' + 10
                                                 : -1;
        if (value < 0) return false;
        uint8_t& byte = bytes[digits++ / 2];
        byte = static_cast<uint8_t>(byte << 4 | value);
    }
    const auto number = [&](int from, int count) {
        uint32_t value = 0;
        for (int i = from; i < from + count; ++i) value = value << 8 | bytes[i];
        return value;
    };
    id.data1 = number(0, 4);
    id.data2 = static_cast<uint16_t>(number(4, 2));
    id.data3 = static_cast<uint16_t>(number(6, 2));
    for (int i = 0; i < 8; ++i) id.data4[i] = bytes[8 + i];
    return true;
}

/// Names of classes, in which the case of letters does not matter.
inline bool same_class_name(std::string_view a, std::string_view b) noexcept
{
    const auto lower = [](char c) { return c >= 'A' && c <= 'Z' ? static_cast<char>(c + 32) : c; };
    if (a.size() != b.size()) return false;
    for (size_t i = 0; i < a.size(); ++i)
        if (lower(a[i]) != lower(b[i])) return false;
    return true;
}

/// A class as a record tells it.
struct recorded_class {
    Qor::GUID class_id{};
    std::string prog_id;
    std::string version_free_id;

    bool answers_to(std::string_view name) const
    {
        return !name.empty() && (same_class_name(name, prog_id) || same_class_name(name, version_free_id));
    }
};

struct module_record {
    std::string path;
    std::vector<recorded_class> classes;
};

/// Any bytes are a record or not: then the answer is false and `why` says what is wrong with which line. Sections and
/// keys that a later version may add are passed over.
inline bool read_record(std::string_view text, module_record& record, std::string& why)
{
    record = {};
    enum { before, in_module, in_class, elsewhere } section = before;
    bool known_format = false;
    int line_number = 0;
    const auto damaged = [&](const char* what) {
        why = "line " + std::to_string(line_number) + ": " + what;
        return false;
    };
    std::vector<bool> identified;
    while (!text.empty()) {
        ++line_number;
        const size_t end = std::min(text.find('\n'), text.size());
        const std::string_view line = text.substr(0, end);
        if (end == text.size()) return damaged("the record ends in the middle of a line");
        text.remove_prefix(end + 1);
        for (const char c : line)
            if (static_cast<unsigned char>(c) < ' ' || c == 127) return damaged("a control character");
        if (line.empty() || line[0] == '#') continue;
        if (line[0] == '[') {
            if (line == "[Module]" && section != before) return damaged("a second [Module]");
            section = line == "[Module]" ? in_module : line == "[Class]" ? in_class : elsewhere;
            if (section == in_class) {
                record.classes.emplace_back();
                identified.push_back(false);
            }
            continue;
        }
        const size_t equals = line.find('=');
        if (equals == line.npos) return damaged("neither a section nor key=value");
        const std::string_view key = line.substr(0, equals), value = line.substr(equals + 1);
        if (section == in_module) {
            if (key == "Format") {
                if (value != "1") return damaged("a format of another version");
                known_format = true;
            } else if (key == "Path") {
                if (value.empty() || value[0] != '/') return damaged("a path that is not absolute");
                record.path = value;
            }
        } else if (section == in_class) {
            recorded_class& last = record.classes.back();
            if (key == "ClassID") {
                if (!guid_from_text(value, last.class_id))
                    return damaged("a class identifier of another form");
                identified.back() = true;
            } else if (key == "ProgID") {
                last.prog_id = value;
            } else if (key == "VersionIndependentProgID") {
                last.version_free_id = value;
            }
        }
    }
    if (!known_format) return damaged("no Format in [Module]");
    if (record.path.empty()) return damaged("no Path in [Module]");
    for (const bool has_id : identified)
        if (!has_id) return damaged("a [Class] without ClassID");
    return true;
}

} // namespace zelt
