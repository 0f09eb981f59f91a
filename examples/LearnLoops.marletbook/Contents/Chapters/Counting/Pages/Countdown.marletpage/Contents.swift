//#-code-completion(everything, hide)
//#-code-completion(currentmodule, show)
//#-code-completion(module, show, Swift)
//#-code-completion(identifier, hide, abs(_:), dump(_:))
//#-code-completion(keyword, show, for, in, let, var)
//#-hidden-code
var pip = Bird()
//#-end-hidden-code
// Up the stairs goes Pip, with the loop that you wrote on the page before.

let stairs = /*#-editable-code number of stairs*//*#-copy-destination("Stairs.marletpage", stairCount)*/12/*#-end-copy-destination*//*#-end-editable-code*/

//#-editable-code Tap to write the way up
//#-copy-destination("Stairs.marletpage", climb)
for stair in 1 ... stairs {
    pip.hop(to: stair)
}
//#-end-copy-destination
//#-end-editable-code

// And down again! A range always counts up, but you can turn it round:
// `(1 ... 3).reversed()` gives 3, 2, 1.
//
// Your turn: let Pip hop down all the stairs, from the highest to the lowest.

//#-editable-code Tap to write the way down
for stair in <#the stairs from top to bottom#> {
    pip.hop(to: stair)
}
//#-end-editable-code

//#-hidden-code
let wayUp = Array(1 ... stairs)
check(
    pip.path == wayUp + wayUp.reversed(),
    praise: "Pip is home in time for supper.",
    hint: "On the way down the first hop goes to stair \(stairs)."
)
//#-end-hidden-code
