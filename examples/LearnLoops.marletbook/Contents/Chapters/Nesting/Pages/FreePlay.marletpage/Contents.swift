// This page is all yours: you may change every line of it.
//
// You know loops that count, loops that collect and loops within loops. What
// will you make of them? Here is the sea on a calm day, to begin with.

let waves = 6
let width = 10

for wave in 1 ... waves {
    var line = ""
    for place in 1 ... width {
        line += (wave + place).isMultiple(of: 3) ? "~" : " "
    }
    print(line)
}
