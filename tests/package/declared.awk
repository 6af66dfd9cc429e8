# SPDX-License-Identifier: Apache-2.0
# From the preprocessed public header: the name of each function that it declares itself.
/^# [0-9]+ "/ { own = /\/ovrinresize\.h"/; next }
/^#/ { next }
own { text = text " " $0 }
END {
    while (gsub(/\{[^{}]*\}/, "", text)) continue
    count = split(text, statements, ";")
    for (i = 1; i <= count; ++i) {
        statement = statements[i]
        if (statement ~ /^ *(typedef|struct|union|enum) /) continue
        gsub(/__attribute__ *\(\([a-z_]+(\("[a-z]+"\))?\)\)/, "", statement)
        if (!match(statement, /[A-Za-z_][A-Za-z_0-9]* *\(/)) continue
        name = substr(statement, RSTART, RLENGTH - 1)
        gsub(/ /, "", name)
        print name
    }
}
