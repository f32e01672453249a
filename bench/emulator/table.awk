# From the lines of quillonBench --instructions, the table of instructions a pixel:
# ours, and the fewest of a peer.
BEGIN { FS = "\t" }

$3 == "quillon" {
    ++rows
    name[rows] = $2 ", " $1
    ours[rows] = $5 / $4
    next
}
!(rows in best) || $5 / $4 < best[rows] {
    best[rows] = $5 / $4
    peer[rows] = $3
}

END {
    print "| Operation | Ours | Best peer | Ours by theirs |\n|---|---:|---:|---:|"
    for (row = 1; row <= rows; ++row) {
        if (!(row in best)) {
            printf "| %s | %.2f | | |\n", name[row], ours[row]
            continue
        }
        ratio = ours[row] / best[row]
        printf "| %s | %.2f | %.2f (%s) | %.2f |\n", name[row], ours[row], best[row], peer[row], ratio
        logarithms += log(ratio)
        ++compared
        above += ratio > 1
    }
    printf "\nGeometric mean over the %d with a peer: %.2f; ours takes more in %d of them.\n",
           compared, exp(logarithms / compared), above
}
