//#-hidden-code
//#-code-completion(everything, hide)
//#-code-completion(literal, show, integer, string)
var lamp = Lamp()
//#-end-hidden-code
// Pip, the bird in the lighthouse, wants to greet a ship. Writing the same line
// again and again would be tiring. A *loop* does it for you: the code between
// the braces runs once for each number from 1 to the number on the right.
//
// Your turn: let the lamp flash at least five times, and choose Pip's greeting.

for _ in 1 ... /*#-editable-code number of flashes*/7/*#-end-editable-code*/ {
    lamp.blink()
    print(/*#-editable-code Pip's greeting*/"Hello, ship!"/*#-end-editable-code*/)
}

//#-hidden-code
check(
    lamp.flashes >= 5,
    praise: "The ship sounds its horn. It has seen you!",
    hint: "The ship counted \(lamp.flashes) flashes. It looks up at the fifth."
)
//#-end-hidden-code
