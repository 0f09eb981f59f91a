//#-code-completion(everything, hide)
//#-code-completion(currentmodule, show)
//#-code-completion(pageauxiliarymodule, show)
//#-code-completion(keyword, show, for, if, else)
//#-code-completion(literal, show, string)
// 🌊 Ahoj! Five harbours report their weather with one emoji each: Tromsø,
// Ærøskøbing, Łeba, Saint-Malo and A Coruña. They stand in `morningReports`.
//
// Pip puts them into one message for the ships: the greeting first, and then
// one signal after the other. The variable grows with each round.
//
// Your turn: greet the ships in your language. Then let a sunny harbour ☀️ send
// a 😎 instead of its weather. An `if` inside the loop decides for each report.

let greeting = /*#-editable-code your greeting*/"Grüße, ihr Schiffe ⛵️! "/*#-end-editable-code*/
var message = greeting

for report in morningReports {
    //#-editable-code Tap to write what each report adds
    message += report
    //#-end-editable-code
}

print(message)

//#-hidden-code
check(
    message == greeting + "😎🌧️⛈️😎🌫️",
    praise: "All ships answer: 👍",
    hint: "After the greeting the ships expect 😎🌧️⛈️😎🌫️."
)
//#-end-hidden-code
