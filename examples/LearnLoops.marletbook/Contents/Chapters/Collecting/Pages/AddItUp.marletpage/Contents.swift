//#-hidden-code
//#-code-completion(everything, hide)
//#-code-completion(identifier, show, boats, count, total)
//#-code-completion(snippet, show, for, if)
//#-end-hidden-code
// Every evening Pip writes down how many fishing boats came home. A loop can
// visit each number of such a list, one after the other.
//
// To add them up you need a variable that lives *outside* the loop. It starts
// at 0, and each round adds a little to it.
//
// Your turn: fill in what each evening adds to the total.

let boats = [3, 5, 2, 8, 4]
var total = 0

for count in boats {
    //#-editable-code Tap to write what each round adds
    total += <#boats of this evening##Int#>
    //#-end-editable-code
}

print("\(total) boats came home this week.")

//#-hidden-code
check(
    total == 22,
    praise: "Every boat is safe in the harbour.",
    hint: "Pip counted 22 boats, and you have \(total)."
)
//#-end-hidden-code
