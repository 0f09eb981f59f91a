//#-hidden-code
//#-code-completion(everything, hide)
//#-code-completion(keyword, show, while)
//#-code-completion(identifier, show, light, hours)
//#-code-completion(literal, show, integer)
//#-end-hidden-code
// After sunset the light fades: each hour leaves half of it. When is it dark?
// You can't know the number of rounds beforehand, so `for` is of no use.
// A `while` loop goes on as long as its question is answered with yes.
//
// Your turn: the loop stops too early. It is dark when the light is below 1.
// And don't forget to count the hours!

var light = 100
var hours = 0

while light >= /*#-editable-code*/50/*#-end-editable-code*/ {
    //#-editable-code
    light /= 2
    //#-end-editable-code
}

print("It is dark after \(hours) hours.")

//#-hidden-code
check(
    light < 1 && hours == 7,
    praise: "Time to light the lamp.",
    hint: "The light is \(light), and you counted \(hours) hours."
)
//#-end-hidden-code
