# Doxygen reads the public headers through this filter.
#
# In the headers a comment (///) documents every declaration directly below it, up to the next comment or blank line.
# Doxygen takes it for that of the first declaration alone, so it is repeated above the others. A warning of Doxygen
# therefore names the right file and declaration, but a later line.

# A line without its literals, its comment and the blanks at its end.
function code(line)
{
    gsub(/"([^"\\]|\\.)*"|'([^'\\]|\\.)+'/, "", line)
    sub(/\/\/.*/, "", line)
    sub(/[ \t]+$/, "", line)
    return line
}

# A group begins or ends. As another style of comment it is not read together with the comments above and below; the
# semicolon keeps the next comment apart from the group. Doxygen orders the groups of a class by their first members,
# data before functions: a friend class, which the site does not show, as the first member of each keeps them in the
# order of the header.
/^ *\/\/\/@[{}]$/ {
    sub(/\/\/\//, "/**")
    comment = ""
    inComment = 0
    print $0 " */" (/}/ ? ";" : /^ / ? " friend class Group" ++groups ";" : "")
    next
}

!inDeclaration && /^ *\/\/\/( |$)/ {
    comment = inComment ? comment "\n" $0 : $0
    inComment = 1
    print
    next
}

!inDeclaration && /^ *(\/\/|#|}|$|public:|protected:|private:)/ {
    comment = NR == head + 1 ? ofHead : ""  # of a class without members
    inComment = 0
    print
    next
}

{
    if (!inDeclaration) {
        if (!inComment && comment != "" && $0 !~ /\/\/\/</)
            print comment
        inComment = 0
        declaration = ""
        depth = 0
    }
    print
    text = code($0)
    declaration = declaration " " text
    inDeclaration = 1

    # What stands inside a class or a namespace is declared on its own.
    if (!depth && text ~ /[{]$/ && declaration ~ /^ *(template *<.*> *)?(inline +)?(class|struct|union|namespace) /) {
        head = NR
        ofHead = comment
        comment = ""
        inDeclaration = 0
        next
    }
    complete = text ~ /[;}]$/
    depth += gsub(/[{(]/, "", text) - gsub(/[})]/, "", text)
    if (depth <= 0 && complete)
        inDeclaration = 0
}
