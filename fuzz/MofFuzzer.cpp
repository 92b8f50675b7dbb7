#include "Input.h"
#include "cimom/ClassRepository.h"

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string_view text = fuzz::text(data, size);
    if (text.find("include") != std::string_view::npos) {
        return 0;  // would read files
    }
    cimom::ClassRepository repository;
    try {
        repository.loadText(text, "input.mof");
        repository.complete();
    } catch (const cimom::MofError& error) {
        fuzz::require(error.line > 0 && error.column > 0);
    }
    return 0;
}
