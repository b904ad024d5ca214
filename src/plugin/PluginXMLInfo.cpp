// SPDX-License-Identifier: MIT
#include "plugin/PluginXMLInfo.hpp"

#include <memory>
#include <stdexcept>

#include <xercesc/framework/LocalFileInputSource.hpp>
#include <xercesc/sax2/SAX2XMLReader.hpp>
#include <xercesc/sax2/XMLReaderFactory.hpp>
#include <xercesc/util/PlatformUtils.hpp>
#include <xercesc/util/SecurityManager.hpp>
#include <xercesc/util/XMLUni.hpp>
#include <xercesc/util/XMLString.hpp>

#include "jexjtag/types.h"
#include "platform/FileSystem.hpp"
#include "plugin/PluginXMLHandler.hpp"
#include "util/Logger.hpp"
#include "util/MethodLogger.hpp"

namespace JexRT {

namespace {

// Owns a text that XMLString::transcode allocated.
struct TranscodedPath {
    XMLCh* text = nullptr;
    explicit TranscodedPath(const std::string& path) : text(xercesc::XMLString::transcode(path.c_str())) {}
    ~TranscodedPath() { xercesc::XMLString::release(&text); }
    TranscodedPath(const TranscodedPath&) = delete;
    TranscodedPath& operator=(const TranscodedPath&) = delete;
};

// Descriptors are local files of the installation: nothing they name is
// loaded (an external DTD or entity goes to the handler, which refuses the
// descriptor; the parser's own resolution is off), and entity expansion is
// limited, so a descriptor cannot make the parser reach the network, read
// other files or expand without end.
constexpr XMLSize_t kEntityExpansionLimit = 1000;

void restrict(xercesc::SAX2XMLReader& reader, xercesc::SecurityManager& security)
{
    using xercesc::XMLUni;
    reader.setFeature(XMLUni::fgXercesDisableDefaultEntityResolution, true);
    reader.setFeature(XMLUni::fgSAX2CoreValidation, false);
    security.setEntityExpansionLimit(kEntityExpansionLimit);
    reader.setProperty(XMLUni::fgXercesSecurityManager, &security);
}

// Parses the readable file at path; JEX_SUCCESS as getPluginXMLInfo says.
// Everything it creates is released in reverse order (handler, input
// source, reader, converted path) before it returns.
unsigned parseDescriptor(const std::string& path, std::vector<std::string>& names)
{
    unsigned status = JEX_FAILURE;
    try {
        TranscodedPath widePath(path);
        if (!widePath.text) throw std::runtime_error("path cannot be converted");
        std::unique_ptr<xercesc::SAX2XMLReader> reader(
            xercesc::XMLReaderFactory::createXMLReader(xercesc::XMLPlatformUtils::fgMemoryManager, nullptr));
        xercesc::LocalFileInputSource source(widePath.text);
        PluginXMLHandler handler;
        xercesc::SecurityManager security;
        restrict(*reader, security);
        reader->setContentHandler(&handler);
        reader->setErrorHandler(&handler);
        reader->setEntityResolver(&handler);

        Logger::logger.printLog(5, "getPluginXMLInfo - Attempting to parse %s\n", path.c_str());
        reader->parse(source);
        if (handler.foundPlugin()) {
            names = handler.targetNames();
            if (!names.empty()) status = JEX_SUCCESS;
        }
    } catch (...) {
        Logger::logger.printLog(5, "getPluginXMLInfo - Parse error!\n");
        names.clear();
        status = JEX_FAILURE;
    }
    return status;
}

} // namespace

unsigned getPluginXMLInfo(std::string path, std::vector<std::string>& names)
{
    MethodLogger tracer;
    tracer.setMethodName("getPluginXMLInfo");
    names.clear();

    try {
        xercesc::XMLPlatformUtils::Initialize();
    } catch (...) {
        Logger::logger.printLog(1, "getPluginXMLInfo - The XML parser could not be initialised\n");
        return tracer.setReturnStatus(JEX_FAILURE);
    }

    unsigned status = JEX_FAILURE;
    // A directory passes the access check but is no descriptor (and the
    // parser would lose memory failing on it).
    if (!jexplatform::isReadable(path) || jexplatform::isDirectory(path))
        Logger::logger.printLog(5, "getPluginXMLInfo - Cannot open xml file: %s\n", path.c_str());
    else
        status = parseDescriptor(path, names);

    xercesc::XMLPlatformUtils::Terminate();
    return tracer.setReturnStatus(status);
}

} // namespace JexRT
