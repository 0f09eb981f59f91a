//#-hidden-code
//#-code-completion(everything, hide)
//#-code-completion(identifier, show, print, min)
//#-end-hidden-code
//#-copy-source(id1)
//#-editable-code Tap here
//#-copy-destination("P\"1", x)
let a = <#T##name##Int#>
//#-end-copy-destination
//#-end-editable-code
//#-end-copy-source
a = /*#-editable-code*/"x"/*#-end-editable-code*/
b = /*#-copy-source(b)*//*#-editable-code n*/1/*#-end-editable-code*//*#-end-copy-source*/
c = /*#-editable-code*//*#-copy-destination("P", b)*/2/*#-end-copy-destination*//*#-end-editable-code*/
