# apt sources in stanzas: keeps those of Debian 12's main suite, for `suite` in its place.
BEGIN { RS = ""; ORS = "\n\n" }
{
    lines = split($0, line, "\n")
    kept = ""
    is_main_suite = has_main = is_off = in_dropped = 0
    for (i = 1; i <= lines; ++i) {
        if (line[i] ~ /^#/) continue
        if (line[i] ~ /^[ \t]/) {  # goes on with the field before
            if (!in_dropped) kept = kept line[i] "\n"
            continue
        }
        in_dropped = 1
        if (line[i] ~ /^Suites:/) {
            if ((line[i] " ") ~ /[ :]bookworm\/? /) is_main_suite = 1
            kept = kept "Suites: " suite "\n"
        } else if (line[i] ~ /^Components:/) {
            if ((line[i] " ") ~ /[ :]main /) has_main = 1
            kept = kept "Components: main\n"
        } else if (line[i] ~ /^Types:/) {
            kept = kept "Types: deb\n"
        } else if (line[i] ~ /^Enabled: *no/) {
            is_off = 1
        } else if (line[i] !~ /^Architectures:/) {
            kept = kept line[i] "\n"
            in_dropped = 0
        }
    }
    if (is_main_suite && has_main && !is_off) print kept
}
