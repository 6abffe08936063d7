# Turns a table of texts, lines of the form "key = text", into C: KYV_LANGUAGE(tag) and a
# KYV_TEXT(key, text) for every other line. Stops at a line that is none.
function complain(why) {
    print FILENAME ":" FNR ": " why ": " $0 > "/dev/stderr"
    failed = 1
    exit 1
}

function quoted(text) {
    gsub(/[\\"]/, "\\\\&", text)
    return "\"" text "\""
}

{ sub(/\r$/, "") }
/^#/ || /^$/ { next }

{
    at = index($0, " = ")
    if (!at) complain("not \"key = text\"")
    key = substr($0, 1, at - 1)
    text = substr($0, at + 3)
    if (key !~ /^[A-Za-z0-9_]+(;[A-Za-z0-9_]+)?$/) complain("no such key is possible")
    if (text !~ /^[^ ]/ || text ~ / $/) complain("an empty text, or blanks round it")
    if (key in seen) complain("the key is there already")
    seen[key] = 1
    if (key == "Language") print "KYV_LANGUAGE(" quoted(text) ")"
    else print "KYV_TEXT(" quoted(key) ", " quoted(text) ")"
}

END {
    if (!failed && !("Language" in seen)) {
        print FILENAME ": no line \"Language = tag\"" > "/dev/stderr"
        exit 1
    }
}
