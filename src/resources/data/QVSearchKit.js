// Helpers for the scripts of tagging rules. Evaluated in every script context before the rule.
(function () {
	var QVSearchKit = {};

	QVSearchKit.global = this;

	QVSearchKit.isDef = function (val) {
		return val !== undefined;
	};

	// Assigns opt_object at the dotted path of name, below opt_objectToExportTo or the global object.
	QVSearchKit.exportSymbol = function (name, opt_object, opt_objectToExportTo) {
		var parts = name.split(".");
		var target = opt_objectToExportTo || QVSearchKit.global;

		// Hosts whose globals can only be declared, not assigned.
		if (!(parts[0] in target) && typeof target.execScript === "function") {
			target.execScript("var " + parts[0]);
		}

		for (var i = 0; i < parts.length; i++) {
			var isLast = i === parts.length - 1;
			if (isLast && QVSearchKit.isDef(opt_object)) {
				target[parts[i]] = opt_object;
			} else if (!target[parts[i]]) {
				target[parts[i]] = {};
			}
			target = target[parts[i]];
		}
	};

	QVSearchKit.api = {};

	QVSearchKit.api.VERSION = '1.0.0';

	// The first element of parameters with that name, or null. An element with a single parameter
	// arrives as an object instead of an array; it has no length, so nothing is found in it.
	QVSearchKit.api.GetPlugInParameter = function (parameters, name) {
		if (!parameters) {
			return null;
		}
		for (var i = 0; i < parameters.length; i++) {
			if (parameters[i].name == name) {
				return parameters[i];
			}
		}
		return null;
	};

	QVSearchKit.exportSymbol("QVSearchKit.api", QVSearchKit.api);
}).call(this);
