// SPDX-License-Identifier: MIT
#pragma once
// PluginXMLHandler - SAX2 content handler that collects the target names of
// a plug-in descriptor:
//
//   <JexPlugin>
//     <targetname>ormund_usbcable</targetname>
//   </JexPlugin>
//
// Every character-data event inside a "targetname" element adds one name,
// exactly as the parser reports it (no trimming, no joining).  Element names
// are compared by local name, exactly and case-sensitively.  Errors and
// warnings are ignored; a fatal error ends the parse with an exception, and
// so does any external entity the descriptor names.

#include <string>
#include <vector>

#include <xercesc/sax2/DefaultHandler.hpp>

namespace JexRT {

class PluginXMLHandler : public xercesc::DefaultHandler {
public:
    PluginXMLHandler() = default;
    ~PluginXMLHandler() override;

    void characters(const XMLCh* const chars, const XMLSize_t length) override;
    // Refuses every external entity and DTD: throws, which ends the parse.
    xercesc::InputSource* resolveEntity(const XMLCh* const publicId, const XMLCh* const systemId) override;
    void endDocument() override;
    void endElement(const XMLCh* const uri, const XMLCh* const localname, const XMLCh* const qname) override;
    void startDocument() override;
    void startElement(const XMLCh* const uri, const XMLCh* const localname, const XMLCh* const qname,
                      const xercesc::Attributes& attrs) override;

    bool foundPlugin() const { return m_foundPlugin; }
    const std::vector<std::string>& targetNames() const { return m_targetNames; }

private:
    bool m_foundPlugin = false;
    bool m_inTargetName = false;
    std::vector<std::string> m_targetNames;
};

} // namespace JexRT
