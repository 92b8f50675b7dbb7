# Completion of cimdhcp for fish: asks the program what may follow.

function __cimdhcp_complete
    set -l words (commandline --tokenize --cut-at-cursor --current-process)
    set -l token (commandline --cut-at-cursor --current-token)
    # An open quote is not part of the word.
    set -l last (string unescape -- $token; or string replace --regex '^[\'"]' '' -- $token)
    # Of "--tree=FILE", the file is completed behind what stays.
    set -l before (string match --regex -- '^--[^=]*=' $last)
    set -l begun (string replace --regex -- '^--[^=]*=' '' $last)
    for line in ($words[1] complete $words[2..-1] "$last" 2>/dev/null)
        switch $line
            case :nospace
                # Fish puts no blank behind a word that ends in "=" or ".".
            case :file
                string replace --regex -- '^' "$before" (__fish_complete_path "$begun")
            case :tree
                string replace --regex -- '^' "$before" (__fish_complete_suffix "$begun" .json)
            case :directory
                string replace --regex -- '^' "$before" (__fish_complete_directories "$begun" '')
            case :host
                string replace --regex -- '^' "$before" (__fish_print_hostnames)
            case '*'
                echo $line
        end
    end
end
complete --command cimdhcp --no-files --arguments '(__cimdhcp_complete)'
