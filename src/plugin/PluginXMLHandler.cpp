// SPDX-License-Identifier: MIT
#include "plugin/PluginXMLHandler.hpp"

#include <xercesc/sax/SAXException.hpp>
#include <xercesc/util/TransService.hpp>

#include "util/Logger.hpp"

namespace JexRT {

namespace {

// The text as UTF-8, the encoding of every narrow text of the library.  A
// text that cannot be converted throws, which ends the parse as an error.
std::string toNarrow(const XMLCh* text, XMLSize_t length)
{
    if (!text || length == 0) return {};
    xercesc::TranscodeToStr narrow(text, length, "UTF-8");
    return std::string(reinterpret_cast<const char*>(narrow.str()), narrow.length());
}

std::string toNarrow(const XMLCh* text) { return text ? toNarrow(text, xercesc::XMLString::stringLen(text)) : std::string(); }

} // namespace

PluginXMLHandler::~PluginXMLHandler() = default;

xercesc::InputSource* PluginXMLHandler::resolveEntity(const XMLCh* const /*publicId*/, const XMLCh* const /*systemId*/)
{
    throw xercesc::SAXException("external entities are not read");
}

void PluginXMLHandler::startDocument()
{
    m_foundPlugin = false;
    m_inTargetName = false;
    m_targetNames.clear();
}

void PluginXMLHandler::startElement(const XMLCh* const, const XMLCh* const localname, const XMLCh* const,
                                    const xercesc::Attributes&)
{
    const std::string name = toNarrow(localname);
    if (name == "JexPlugin") {
        Logger::logger.printLog(5, "PluginXMLHandler::startElement() - Found JexPlugin!\n");
        m_foundPlugin = true;
    } else if (name == "targetname") {
        Logger::logger.printLog(5, "PluginXMLHandler <targetname>");
        m_inTargetName = true;
    }
}

void PluginXMLHandler::characters(const XMLCh* const chars, const XMLSize_t length)
{
    if (!m_inTargetName) return;
    std::string text = toNarrow(chars, length);
    Logger::logger.printLog(5, "%s", text.c_str());
    m_targetNames.push_back(std::move(text));
}

void PluginXMLHandler::endElement(const XMLCh* const, const XMLCh* const localname, const XMLCh* const)
{
    if (toNarrow(localname) == "targetname") {
        Logger::logger.printLog(5, "</targetname>\n");
        m_inTargetName = false;
    }
}

void PluginXMLHandler::endDocument() { m_inTargetName = false; }

} // namespace JexRT
