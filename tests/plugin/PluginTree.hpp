// SPDX-License-Identifier: MIT
#pragma once
// A real plug-in tree for one test: <root>/<company>/<P>/P.so and P.xml,
// with modules copied from the test modules built in JEXJTAG_TEST_MODULE_DIR
// (copied, not linked: the loader treats links to one file as one module).

#include <filesystem>
#include <string>
#include <vector>

#include "support/TestSupport.hpp"

namespace testsupport {

class PluginTree {
public:
    explicit PluginTree(std::filesystem::path root) : m_root(std::move(root))
    {
        std::filesystem::create_directories(m_root);
    }

    // The built test module <module>.so.
    static std::filesystem::path builtModule(const std::string& module)
    {
        return std::filesystem::path(JEXJTAG_TEST_MODULE_DIR) / (module + ".so");
    }
    // A minimal accepted descriptor naming these targets, one line each.
    static std::string descriptor(const std::vector<std::string>& targets)
    {
        std::string text = "<?xml version=\"1.0\"?>\n<JexPlugin>\n";
        for (const std::string& t : targets) text += "  <targetname>" + t + "</targetname>\n";
        return text + "</JexPlugin>\n";
    }

    const std::filesystem::path& root() const { return m_root; }
    std::filesystem::path dir(const std::string& company, const std::string& name) const
    {
        return m_root / company / name;
    }
    std::string xmlPath(const std::string& company, const std::string& name) const
    {
        return (dir(company, name) / (name + ".xml")).string();
    }
    std::string modulePath(const std::string& company, const std::string& name) const
    {
        return (dir(company, name) / (name + ".so")).string();
    }

    // A plug-in P=name serving `targets`, its module a copy of `module`.
    void add(const std::string& company, const std::string& name, const std::string& module,
             const std::vector<std::string>& targets)
    {
        addModule(company, name, module);
        addDescriptor(company, name, descriptor(targets));
    }
    void addModule(const std::string& company, const std::string& name, const std::string& module)
    {
        std::filesystem::create_directories(dir(company, name));
        std::filesystem::copy_file(builtModule(module), modulePath(company, name),
                                   std::filesystem::copy_options::overwrite_existing);
    }
    void addDescriptor(const std::string& company, const std::string& name, const std::string& text)
    {
        writeFile(xmlPath(company, name), text);
    }

private:
    std::filesystem::path m_root;
};

} // namespace testsupport
