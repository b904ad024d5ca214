// SPDX-License-Identifier: MIT
#pragma once
// IDCode - a JTAG IDCODE carried as text: one character per bit, the most
// significant bit first.  '0' and '1' are bit values; an upper-case 'X' is
// a position that comparisons ignore.  The text is kept exactly as given
// (no trimming, no check of length or characters); a code made from a
// number always has 32 characters.

#include <string>

#include "../export.h"

namespace JexRT {

class JEXJTAG_API IDCode {
public:
    // 32 characters '0'.
    IDCode();
    // The 32-character text of code, bit 31 first.
    explicit IDCode(unsigned int code);
    // The text as given.
    explicit IDCode(const std::string& text);
    IDCode(const IDCode& other);
    // Empties the text.
    virtual ~IDCode();

    void setIDCode(unsigned int code);
    void setIDCode(const std::string& text);
    void setIDCode(const IDCode& other);
    IDCode& operator=(unsigned int code);
    IDCode& operator=(const std::string& text);
    IDCode& operator=(const IDCode& other);

    // A copy of the text.
    std::string getIDCode() const;
    // Number of characters of the text.
    unsigned int length() const;
    // The text read as a binary number, the last character as bit 0.  Only
    // a '1' counts as a set bit: '0', a don't-care 'X' (or 'x') and any
    // other character count as 0.  An empty text gives 0; of a text longer
    // than 32 characters only the last 32 count.
    unsigned int getIDCode32() const;
    // The bit at character position index, counted from the left (index 0
    // is bit 31 of a 32-character code): 1 for a '1'; 0 for a '0', an 'X',
    // any other character, or an index not below length().
    unsigned char operator[](unsigned int index) const;

    // Pattern comparison: the shorter text is padded on the left with '0'
    // to the longer one's length; every position must hold the same
    // character, or an upper-case 'X' on either side.  (A lower-case 'x' is
    // an ordinary character here.)  Two empty texts are equal.
    bool isEqual(const IDCode& other) const;
    bool operator==(const IDCode& other) const { return isEqual(other); }
    // Against the 32-character text of code.
    bool operator==(unsigned int code) const;
    // Against the text as given.
    bool operator==(const std::string& text) const;

private:
    std::string m_idcode;
};

} // namespace JexRT
