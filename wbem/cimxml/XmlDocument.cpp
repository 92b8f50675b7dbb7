#include "cimxml/XmlDocument.h"

#include <expat.h>

#include <algorithm>
#include <limits>
#include <memory>
#include <new>
#include <type_traits>

namespace cimom::wbem {

namespace {

/// Builds the tree. expat is C: no exception may pass through it, so that a
/// reason to stop is kept until it has returned.
class Builder {
  public:
    Builder(XML_Parser parser, std::size_t maximumDepth)
        : parser_(parser), maximumDepth_(maximumDepth) {
        XML_SetUserData(parser, this);
        XML_SetElementHandler(parser, startElement, endElement);
        XML_SetCharacterDataHandler(parser, characters);
        XML_SetStartDoctypeDeclHandler(parser, documentType);
    }

    XmlElement read(std::string_view text) {
        const bool fits = text.size() <= static_cast<std::size_t>(std::numeric_limits<int>::max());
        if (!fits || XML_Parse(parser_, text.data(), static_cast<int>(text.size()), XML_TRUE) !=
                         XML_STATUS_OK) {
            const char* reason = fits ? XML_ErrorString(XML_GetErrorCode(parser_)) : "too long";
            if (outOfMemory_) {
                throw std::bad_alloc();
            }
            if (stopped_ != nullptr) {
                reason = stopped_;
            }
            throw XmlError("line " + std::to_string(XML_GetCurrentLineNumber(parser_)) + ": " +
                           reason);
        }
        return std::move(root_);
    }

  private:
    static Builder& of(void* self) { return *static_cast<Builder*>(self); }

    void stop(const char* reason) {
        stopped_ = reason;
        XML_StopParser(parser_, XML_FALSE);
    }

    template <typename Step>
    void guarded(Step&& step) {
        try {
            std::forward<Step>(step)();
        } catch (const std::bad_alloc&) {
            outOfMemory_ = true;
            stop("out of memory");
        }
    }

    static void XMLCALL startElement(void* self, const char* name, const char** attributes) {
        Builder& builder = of(self);
        builder.guarded([&] {
            if (builder.open_.size() >= builder.maximumDepth_) {
                builder.stop("elements are nested too deep");
                return;
            }
            // The parent's children may move when one is added, but none of them is
            // open then: pointers to open elements stay valid.
            XmlElement& element = builder.open_.empty()
                                      ? builder.root_
                                      : builder.open_.back()->children.emplace_back();
            element.name = name;
            for (const char** entry = attributes; *entry != nullptr; entry += 2) {
                element.attributes.emplace_back(entry[0], entry[1]);
            }
            builder.open_.push_back(&element);
        });
    }

    static void XMLCALL endElement(void* self, const char* /*name*/) {
        Builder& builder = of(self);
        if (builder.stopped_ == nullptr) {
            builder.open_.pop_back();
        }
    }

    static void XMLCALL characters(void* self, const char* text, int length) {
        Builder& builder = of(self);
        if (builder.stopped_ == nullptr && !builder.open_.empty()) {
            builder.guarded(
                [&] { builder.open_.back()->text.append(text, static_cast<std::size_t>(length)); });
        }
    }

    static void XMLCALL documentType(void* self, const char* /*name*/, const char* /*system*/,
                                     const char* /*publicId*/, int /*hasInternalSubset*/) {
        of(self).stop("a document type declaration is not accepted");
    }

    XML_Parser parser_;
    std::size_t maximumDepth_;
    XmlElement root_;
    std::vector<XmlElement*> open_;
    const char* stopped_ = nullptr;
    bool outOfMemory_ = false;
};

struct Freed {
    void operator()(XML_Parser parser) const noexcept { XML_ParserFree(parser); }
};

}  // namespace

const std::string* XmlElement::attribute(std::string_view wanted) const noexcept {
    const auto found = std::find_if(attributes.begin(), attributes.end(),
                                    [wanted](const auto& each) { return each.first == wanted; });
    return found == attributes.end() ? nullptr : &found->second;
}

XmlElement readXml(std::string_view text, std::size_t maximumDepth) {
    const std::unique_ptr<std::remove_pointer_t<XML_Parser>, Freed> parser(
        XML_ParserCreate("UTF-8"));
    if (!parser) {
        throw std::bad_alloc();
    }
    return Builder(parser.get(), maximumDepth).read(text);
}

}  // namespace cimom::wbem
