// Evaluates an expression. Returns its value as a boolean and as JSON, or the exception as a string.
(function (expression) {
    try {
        var value = (0, eval)('(' + expression + '\n)');
        var json = JSON.stringify(value);
        return { truth: !!value, json: json === undefined ? 'null' : json };
    } catch (error) {
        return { error: String(error) };
    }
})
