# apt sources in lines: keeps those of Debian 12's main suite, for `suite` in its place.
/^[ \t]*deb[ \t]/ {
    line = $0
    options = ""
    if (match(line, /\[[^]]*\]/)) {
        options = substr(line, RSTART, RLENGTH)
        sub(/\[[^]]*\]/, "", line)
    }
    gsub(/arch[a-z]*[-+]?=[^] ]*/, "", options)
    if (options ~ /^\[[ \t]*\]$/) options = ""
    words = split(line, word)
    has_main = 0
    for (i = 4; i <= words; ++i) if (word[i] == "main") has_main = 1
    if (word[3] == "bookworm" && has_main) print "deb " options " " word[2] " " suite " main"
}
