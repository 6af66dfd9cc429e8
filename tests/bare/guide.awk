# SPDX-License-Identifier: Apache-2.0
# Turns a guide into a script that does what it says: a block below a line "`FILE`:" becomes that file, a
# block of sh is run, and a block of text is compared with what the last one printed.
/^`[^`]+`:$/ { name = $0; gsub(/[`:]/, "", name); next }
/^```[a-z]/ && !inside {
    inside = 1
    kind = substr($0, 4)
    if (name != "") printf "mkdir -p \"$(dirname %s)\"\ncat >%s <<'END_OF_FILE'\n", name, name
    else if (kind == "sh") { print "cat >commands <<'END_OF_FILE'"; ++runs }
    else if (kind == "text") print "cat >expected <<'END_OF_FILE'"
    else { printf "%s: a block that is neither file nor command\n", FILENAME >"/dev/stderr"; exit 1 }
    next
}
/^```$/ && inside {
    inside = 0
    print "END_OF_FILE"
    if (name == "" && kind == "sh")
        print "sed 's/^/$ /' commands\nbash -e commands >printed 2>&1 || { tail -n 30 printed; exit 1; }\ntail -n 3 printed"
    if (name == "" && kind == "text") print "diff expected printed"
    name = ""
    next
}
inside { print }
END { if (!runs) exit 1 }
