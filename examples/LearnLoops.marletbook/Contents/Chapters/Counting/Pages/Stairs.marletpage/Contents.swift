//#-code-completion(everything, hide)
//#-code-completion(keyword, show, for, in)
//#-code-completion(identifier, show, pip, stair, stairs, hop(to:), print(_:))
//#-hidden-code
var pip = Bird()
//#-end-hidden-code
// A loop can tell you which round it is in. Give the number a name in place of
// the underscore, and use that name between the braces.
//
// Your turn: Pip hops to stair 1 every time, and so gets nowhere. Let Pip climb
// to the top. You may build a taller lighthouse, too.

let stairs = /*#-copy-source(stairCount)*//*#-editable-code number of stairs*/12/*#-end-editable-code*//*#-end-copy-source*/

//#-copy-source(climb)
//#-editable-code Tap to write your loop
for stair in 1 ... stairs {
    pip.hop(to: 1)
}
//#-end-editable-code
//#-end-copy-source

//#-hidden-code
check(
    pip.path == Array(1 ... stairs),
    praise: "What a view from up here!",
    hint: "Which name holds the number of the round?"
)
//#-end-hidden-code
