#include "platform/linux/drawing/VectorCheck.h"

#include <expat.h>
#include <glib.h>

#include <memory>
#include <string>
#include <string_view>

namespace platform {

namespace {

constexpr std::size_t mostBytes = 1024 * 1024;
constexpr std::size_t mostElements = 20'000;
constexpr std::size_t mostText = 4096;  // bytes; laying out a word of a megabyte takes gigabytes

bool isUTF8(std::span<const std::byte> data) {
    return g_utf8_validate_len(reinterpret_cast<const char*>(data.data()), data.size(), nullptr);
}

// Readers of URLs overlook spaces and control characters, and the case of a scheme.
bool isEmbeddedFile(std::string_view url) {
    constexpr std::string_view scheme = "data:";
    std::string beginning;
    for (const char c : url) {
        if (beginning.size() == scheme.size())
            break;
        if (static_cast<unsigned char>(c) > ' ')
            beginning += g_ascii_tolower(c);
    }
    return beginning == scheme;
}

bool isReference(std::string_view attribute) {
    return attribute == "href" || attribute.ends_with(":href");
}

bool isText(std::string_view element) {
    return element == "text" || element.ends_with(":text");
}

class Check {
  public:
    Check() {
        XML_SetUserData(parser_.get(), this);
        XML_SetXmlDeclHandler(parser_.get(), encodingDeclared);
        XML_SetEntityDeclHandler(parser_.get(), entityDeclared);
        XML_SetElementHandler(parser_.get(), elementBegan, elementEnded);
        XML_SetCharacterDataHandler(parser_.get(), textCame);
    }
    bool passes(std::span<const std::byte> data) {
        return XML_Parse(parser_.get(), reinterpret_cast<const char*>(data.data()),
                         static_cast<int>(data.size()), /*isFinal=*/true) == XML_STATUS_OK;
    }

  private:
    struct Free {
        void operator()(XML_Parser parser) const { XML_ParserFree(parser); }
    };

    void refuse() { XML_StopParser(parser_.get(), /*resumable=*/false); }

    static void XMLCALL encodingDeclared(void* self, const XML_Char*, const XML_Char* encoding, int) {
        if (encoding && g_ascii_strcasecmp(encoding, "UTF-8") != 0)
            static_cast<Check*>(self)->refuse();
    }
    static void XMLCALL entityDeclared(void* self, const XML_Char*, int, const XML_Char*, int,
                                       const XML_Char*, const XML_Char*, const XML_Char*, const XML_Char*) {
        static_cast<Check*>(self)->refuse();
    }
    static void XMLCALL elementBegan(void* self, const XML_Char* name, const XML_Char** attributes) {
        Check& check = *static_cast<Check*>(self);
        check.textsAround_ += isText(name);
        if (++check.elements_ > mostElements)
            check.refuse();
        for (; *attributes; attributes += 2)
            if (isReference(attributes[0]) && isEmbeddedFile(attributes[1]))
                check.refuse();
    }

    static void XMLCALL elementEnded(void* self, const XML_Char* name) {
        static_cast<Check*>(self)->textsAround_ -= isText(name);
    }
    static void XMLCALL textCame(void* self, const XML_Char*, int length) {
        Check& check = *static_cast<Check*>(self);
        if (check.textsAround_ > 0 && (check.text_ += static_cast<std::size_t>(length)) > mostText)
            check.refuse();
    }

    std::unique_ptr<XML_ParserStruct, Free> parser_{XML_ParserCreate(nullptr)};
    std::size_t elements_ = 0;
    int textsAround_ = 0;
    std::size_t text_ = 0;  // within them
};

}  // namespace

bool isHarmlessVector(std::span<const std::byte> data) {
    return data.size() <= mostBytes && isUTF8(data) && Check().passes(data);
}

}  // namespace platform
