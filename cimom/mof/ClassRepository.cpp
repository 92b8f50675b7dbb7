#include "cimom/ClassRepository.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <deque>
#include <fstream>
#include <system_error>
#include <unordered_map>
#include <utility>

#include "cimom/ClassDeclaration.h"
#include "cimom/MofError.h"
#include "cimom/Names.h"
#include "mof/ClassResolver.h"
#include "mof/MofParser.h"
#include "mof/QualifierTypes.h"

namespace cimom {

namespace {

/// Throws std::system_error.
std::string contentOf(const std::filesystem::path& file) {
    const auto failed = [] { throw std::system_error(errno, std::generic_category()); };
    errno = 0;
    std::ifstream stream(file, std::ios::binary);
    if (!stream) {
        failed();
    }
    std::string content;
    std::array<char, 65536> block{};
    do {
        stream.read(block.data(), block.size());
        content.append(block.data(), static_cast<std::size_t>(stream.gcount()));
    } while (stream);
    // A directory can be opened, but not read.
    if (stream.bad()) {
        failed();
    }
    return content;
}

}  // namespace

class ClassRepository::Implementation {
  public:
    struct Node {
        ClassDeclaration declaration;
        const Node* superclass = nullptr;
        bool stands = false;                       ///< against further declarations
        std::vector<const Node*> subclasses = {};  ///< in the order of loading
    };

    void loadFile(const std::filesystem::path& file) {
        std::string content;
        try {
            content = contentOf(file);
        } catch (const std::system_error& error) {
            throw MofError(file.string(), {}, "cannot be read: " + error.code().message());
        }
        std::error_code ignored;  // an empty name only delays the detection of a cycle
        const Including guard(including_, std::filesystem::weakly_canonical(file, ignored));
        loadText(content, file.string());
    }

    void loadText(std::string_view text, const std::string& file) {
        MofParser parser(text, file);
        while (auto declaration = parser.next()) {
            std::visit([this, &file](const auto& each) { add(each, file); }, *declaration);
        }
    }

    [[nodiscard]] const Node* find(std::string_view name) const {
        const auto found = nodesByName_.find(name);
        return found == nodesByName_.end() ? nullptr : found->second;
    }

    [[nodiscard]] static bool isA(const Node* node, std::string_view ancestor) {
        while (node != nullptr && !sameName(node->declaration.name, ancestor)) {
            node = node->superclass;
        }
        return node != nullptr;
    }

    [[nodiscard]] const std::deque<Node>& nodes() const noexcept { return nodes_; }
    [[nodiscard]] const QualifierTypes& qualifierTypes() const noexcept { return qualifierTypes_; }

    void keepDeclared() noexcept {
        for (Node& node : nodes_) {
            node.stands = true;
        }
        qualifierTypes_.keepDeclared();
    }

    void complete() const {
        for (const ReferenceUse& use : forwardReferences_) {
            if (find(use.className) == nullptr) {
                throw MofError(use.file, use.position, "class " + use.className + " is not known");
            }
            checkNarrowing(use);
        }
    }

  private:
    void add(const MofPragma& pragma, const std::string& file) {
        // The others (locale, namespace, source and so on) say nothing about
        // classes; DSP0004 has unknown ones ignored.
        if (!sameName(pragma.name, "include")) {
            return;
        }
        const auto included = std::filesystem::path(file).parent_path() / pragma.value;
        std::error_code error;
        const auto canonical = std::filesystem::canonical(included, error);
        if (error) {
            throw MofError(file, pragma.position,
                           included.string() + " cannot be read: " + error.message());
        }
        if (std::find(including_.begin(), including_.end(), canonical) != including_.end()) {
            throw MofError(file, pragma.position, included.string() + " includes itself");
        }
        loadFile(included);
    }

    void add(const MofQualifierType& declaration, const std::string& file) {
        qualifierTypes_.add(declaration, file);
    }

    void add(const MofClass& written, const std::string& file) {
        if (const Node* const known = find(written.name)) {
            if (known->stands) {
                return;
            }
            throw MofError(file, written.position, "class " + written.name + " is declared twice");
        }
        Node* superclass = nullptr;
        if (!written.superclass.empty()) {
            const auto found = nodesByName_.find(written.superclass);
            if (found == nodesByName_.end()) {
                throw MofError(file, written.superclassPosition,
                               "superclass " + written.superclass + " is not known");
            }
            superclass = found->second;
        }
        auto [declaration, references] =
            resolveClass(written, superclass == nullptr ? nullptr : &superclass->declaration,
                         qualifierTypes_, file);
        std::erase_if(references, [this](const ReferenceUse& use) {
            const bool known = find(use.className) != nullptr;
            if (known) {
                checkNarrowing(use);
            }
            return known;
        });
        forwardReferences_.insert(forwardReferences_.end(), references.begin(), references.end());
        declaration.index = PropertyIndex(declaration.properties);
        Node& node = nodes_.emplace_back(Node{std::move(declaration), superclass});
        nodesByName_.emplace(node.declaration.name, &node);
        if (superclass != nullptr) {
            superclass->subclasses.push_back(&node);
        }
    }

    void checkNarrowing(const ReferenceUse& use) const {
        if (!use.formerClass.empty() && !isA(find(use.className), use.formerClass)) {
            throw MofError(use.file, use.position,
                           use.className + " is not a subclass of " + use.formerClass +
                               ", which the superclass references");
        }
    }

    /// Names a file as being read for as long as it lives.
    class Including {
      public:
        Including(std::vector<std::filesystem::path>& files, std::filesystem::path file)
            : files_(files) {
            files_.push_back(std::move(file));
        }
        ~Including() { files_.pop_back(); }
        Including(const Including&) = delete;
        Including& operator=(const Including&) = delete;

      private:
        std::vector<std::filesystem::path>& files_;
    };

    /// A deque, so that the addresses which the map and the nodes hold stay valid.
    std::deque<Node> nodes_;
    std::unordered_map<std::string_view, Node*, NameHash, NameEqual> nodesByName_;
    QualifierTypes qualifierTypes_;
    std::vector<ReferenceUse> forwardReferences_;
    std::vector<std::filesystem::path> including_;
};

ClassRepository::ClassRepository() : implementation_(std::make_unique<Implementation>()) {}
ClassRepository::~ClassRepository() = default;
ClassRepository::ClassRepository(ClassRepository&&) noexcept = default;
ClassRepository& ClassRepository::operator=(ClassRepository&&) noexcept = default;

void ClassRepository::load(const std::filesystem::path& file) {
    implementation_->loadFile(file);
}

void ClassRepository::loadDirectory(const std::filesystem::path& directory) {
    std::vector<std::filesystem::path> files;
    try {
        for (const auto& entry : std::filesystem::directory_iterator(directory)) {
            if (entry.path().extension() == ".mof") {
                files.push_back(entry.path());
            }
        }
    } catch (const std::filesystem::filesystem_error& error) {
        throw MofError(directory.string(), {}, "cannot be read: " + error.code().message());
    }
    std::sort(files.begin(), files.end());
    for (const auto& file : files) {
        load(file);
    }
}

void ClassRepository::loadText(std::string_view text, const std::string& file) {
    implementation_->loadText(text, file);
}

void ClassRepository::keepDeclared() noexcept {
    implementation_->keepDeclared();
}

void ClassRepository::complete() const {
    implementation_->complete();
}

const ClassDeclaration* ClassRepository::find(std::string_view className) const {
    const auto* const node = implementation_->find(className);
    return node == nullptr ? nullptr : &node->declaration;
}

bool ClassRepository::isA(std::string_view className, std::string_view ancestor) const {
    return Implementation::isA(implementation_->find(className), ancestor);
}

std::vector<const ClassDeclaration*> ClassRepository::withSubclasses(
    std::string_view className) const {
    std::vector<const ClassDeclaration*> result;
    std::vector<const Implementation::Node*> open;
    if (const auto* const node = implementation_->find(className)) {
        open.push_back(node);
    }
    while (!open.empty()) {
        const auto* const node = open.back();
        open.pop_back();
        result.push_back(&node->declaration);
        open.insert(open.end(), node->subclasses.rbegin(), node->subclasses.rend());
    }
    return result;
}

std::optional<QualifierType> ClassRepository::findQualifierType(std::string_view name) const {
    return implementation_->qualifierTypes().find(name);
}

std::vector<QualifierType> ClassRepository::qualifierTypes() const {
    return implementation_->qualifierTypes().all();
}

std::vector<const ClassDeclaration*> ClassRepository::classes() const {
    std::vector<const ClassDeclaration*> result;
    result.reserve(implementation_->nodes().size());
    for (const auto& node : implementation_->nodes()) {
        result.push_back(&node.declaration);
    }
    return result;
}

}  // namespace cimom
