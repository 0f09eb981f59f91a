//#-copy-source(1x)
//#-code-completion(module, maybe)/*#-bogus /*#-editable-code*/ <#a##b#> <#>
//#-end-hidden-code
//#-hidden-code
//#-editable-code
//#-end-hidden-code
//#-end-editable-code
//#-hidden-codes
// #-hidden-code
//#-Hidden-Code
//#-end-hidden-code x
//#-code-completion(module)
// just a comment #-x
	//#-copy-source(1x)
/*#-hidden-code*/ /*#-end-editable-code x*/ é😀 /*#-editabel-code*/
