# What can stand next is what the program says; where it says nothing, a file.
function __lexicor_complete
    set -l words (commandline -opc)
    set -l said ($words[1] --complete $words[2..-1] (commandline -ct) 2>/dev/null)
    if set -q said[1]
        printf '%s\n' $said
    else
        __fish_complete_path (commandline -ct)
    end
end
for program in lexicor lexicor-data lexicor-gencat
    complete -c $program -f -a '(__lexicor_complete)'
end
