// SPDX-License-Identifier: MIT
#include "plugin/PluginModule.hpp"

namespace JexRT {

void PluginModule::reset()
{
    handle = jexplatform::DynamicLibrary();
    name.clear();
    libraryPath.clear();
    xmlPath.clear();
    targetNames.clear();
    create = nullptr;
    destroy = nullptr;
    loaded = nullptr;
    unloaded = nullptr;
    setCallbacks = nullptr;
}

} // namespace JexRT
