#include "cimxml/XmlDocument.h"

#include <expat.h>

#include <algorithm>
#include <memory>
#include <new>
#include <type_traits>

namespace cimom::wbem {

namespace {

/// Builds the tree. expat is C: no exception may pass through it, so that a
/// reason to stop is kept until it has returned.
class Builder {
  public:
    Builder(XML_Parser parser, std::size_t maximumDepth, std::size_t maximumMemory)
        : parser_(parser), maximumDepth_(maximumDepth), memory_(maximumMemory) {
        XML_SetUserData(parser, this);
        XML_SetElementHandler(parser, startElement, endElement);
        XML_SetCharacterDataHandler(parser, characters);
        XML_SetStartDoctypeDeclHandler(parser, documentType);
    }

    XmlElement read(std::string_view text) {
        // expat copies what it is given.
        constexpr std::size_t piece = 65536;
        bool isGood = true;
        bool isLast = false;
        while (isGood && !isLast) {
            const std::string_view next = text.substr(0, piece);
            text.remove_prefix(next.size());
            isLast = text.empty();
            isGood = XML_Parse(parser_, next.data(), static_cast<int>(next.size()),
                               isLast ? XML_TRUE : XML_FALSE) == XML_STATUS_OK;
        }
        if (!isGood) {
            const char* reason = XML_ErrorString(XML_GetErrorCode(parser_));
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

    /// False, and the parser stops, when the document takes more than it may.
    bool pay(std::size_t bytes) {
        if (bytes > memory_) {
            stop("the elements are too many for their length");
            return false;
        }
        memory_ -= bytes;
        return true;
    }

    /// What a string has in memory of its own, about.
    static std::size_t heapOf(std::string_view text) {
        constexpr std::size_t inside = 15;
        return text.size() > inside ? text.size() + 1 : 0;
    }

    /// Makes room for one more child. Grows in smaller steps than a vector would by itself:
    /// while it grows, there are two of it.
    bool payForChild(std::vector<XmlElement>& children) {
        if (children.size() < children.capacity()) {
            return true;
        }
        const std::size_t more = children.size() / 4 + 1;
        if (!pay((children.size() + more) * sizeof(XmlElement))) {
            return false;
        }
        const std::size_t before = children.capacity();
        children.reserve(children.size() + more);
        memory_ += before * sizeof(XmlElement);
        return true;
    }

    bool payForAttributes(const char** attributes) {
        std::size_t bytes = 0;
        for (const char** entry = attributes; *entry != nullptr; entry += 2) {
            bytes += sizeof(XmlElement::attributes[0]) + heapOf(entry[0]) + heapOf(entry[1]);
        }
        return pay(bytes);
    }

    static void XMLCALL startElement(void* self, const char* name, const char** attributes) {
        Builder& builder = of(self);
        builder.guarded([&] {
            if (builder.open_.size() >= builder.maximumDepth_) {
                builder.stop("elements are nested too deep");
                return;
            }
            if ((!builder.open_.empty() && !builder.payForChild(builder.open_.back()->children)) ||
                !builder.pay(heapOf(name)) || !builder.payForAttributes(attributes)) {
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
            builder.guarded([&] {
                const std::string_view added(text, static_cast<std::size_t>(length));
                // A text that grows has up to twice its length.
                if (builder.pay(2 * added.size())) {
                    builder.open_.back()->text.append(added);
                }
            });
        }
    }

    static void XMLCALL documentType(void* self, const char* /*name*/, const char* /*system*/,
                                     const char* /*publicId*/, int /*hasInternalSubset*/) {
        of(self).stop("a document type declaration is not accepted");
    }

    XML_Parser parser_;
    std::size_t maximumDepth_;
    std::size_t memory_;  ///< what the document may still take
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

XmlElement readXml(std::string_view text, std::size_t maximumDepth, std::size_t maximumMemory) {
    const std::unique_ptr<std::remove_pointer_t<XML_Parser>, Freed> parser(
        XML_ParserCreate("UTF-8"));
    if (!parser) {
        throw std::bad_alloc();
    }
    return Builder(parser.get(), maximumDepth, maximumMemory).read(text);
}

}  // namespace cimom::wbem
