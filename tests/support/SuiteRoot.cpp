// SPDX-License-Identifier: Apache-2.0
#include "SuiteRoot.h"

#include <cstdlib>
#include <filesystem>

namespace fs = std::filesystem;

namespace support {

namespace {

std::string entry(const std::string& key, const std::string& value) {
    const std::size_t slash = key.find('/');
    if (slash == std::string::npos) {
        return "<key>" + key + "</key><string><![CDATA[" + value + "]]></string>";
    }
    return "<key>" + key.substr(0, slash) + "</key><dict>" + entry(key.substr(slash + 1), value) +
           "</dict>";
}

std::string plistText(const std::string& entries) {
    return "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<plist version=\"1.0\"><dict>" + entries +
           "</dict></plist>\n";
}

} // namespace

SuiteRoot::SuiteRoot(const std::string& name) : m_name(name), m_path(m_folder.makeFolder(name)) {
    setenv("TINTGATE_ROOT", m_path.c_str(), 1);
}

SuiteRoot::~SuiteRoot() {
    unsetenv("TINTGATE_ROOT");
}

std::string SuiteRoot::write(const std::string& name, const std::string& text) const {
    return m_folder.write(m_name + "/" + name, text);
}

void SuiteRoot::installPlistReader(const std::string& program) const {
    fs::create_directories(path("usr/libexec"));
    fs::create_symlink(program, path("usr/libexec/Plistbuddy"));
}

void SuiteRoot::writePreferences(
    const std::string& name, const std::vector<std::pair<std::string, std::string>>& values) const {
    std::string entries;
    for (const auto& [key, value] : values) {
        entries += entry(key, value);
    }
    write("Library/Preferences/" + name, plistText(entries));
}

std::string SuiteRoot::makeBundle(const std::string& name, const std::string& sharedObject,
                                  const std::string& entries) const {
    write(name + "/Contents/Info.plist", plistText(entries));
    const fs::path folder = path(name) + "/Contents/MacOS";
    fs::create_directories(folder);
    if (!sharedObject.empty()) {
        fs::copy_file(sharedObject, folder / fs::path(sharedObject).filename());
    }
    return path(name);
}

void SuiteRoot::installCommBundle(const std::string& bundle) const {
    writePreferences("Qen/com.qen.packageversion.plist",
                     {{"Nerova Hue Workbench/library_path", path("suite")}});
    fs::create_directories(path("suite/lib"));
    fs::create_directory_symlink(bundle, path("suite/lib/ComGUI.Bundle"));
}

std::string SuiteRoot::copyProgram(const std::string& program, const std::string& name) const {
    fs::create_directories(fs::path(path(name)).parent_path());
    fs::copy_file(program, path(name), fs::copy_options::overwrite_existing);
    return path(name);
}

std::string plugInEntries(const std::string& executable, const std::string& type,
                          const std::string& factory, const std::string& function) {
    return "<key>CFBundleExecutable</key><string>" + executable +
           "</string><key>CFPlugInTypes</key><dict><key>" + type + "</key><array><string>" +
           factory + "</string></array></dict><key>CFPlugInFactories</key><dict><key>" + factory +
           "</key><string>" + function + "</string></dict>";
}

} // namespace support
