//#-code-completion(everything, hide)
//#-code-completion(currentmodule, show)
//#-code-completion(chapterauxiliarymodule, show)
//#-code-completion(keyword, show, for, if)
// Which night was the brightest? Nobody can look at all numbers at once, and a
// loop can't either. It remembers the best one *so far*, and each round asks
// whether the next number is better.
//
// Your turn: fill in the question, and what to remember when the answer is yes.

let nights: [Brightness] = [40, 75, 60, 90, 85]
var brightest = nights[0]

for night in nights {
    //#-editable-code Tap to compare
    if <#T##this night is brighter##Bool#> {
        brightest = <#T##the new best##Brightness##Int#>
    }
    //#-end-editable-code
}

print("The brightest night had \(brightest) percent.")

//#-hidden-code
check(
    brightest == 90,
    praise: "That was the night of the full moon.",
    hint: "Compare `night` with `brightest`. You found \(brightest)."
)
//#-end-hidden-code
